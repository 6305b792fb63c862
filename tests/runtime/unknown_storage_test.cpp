#include <orv/unknown_storage.hpp>

#include <gtest/gtest.h>

#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/wire_cases.hpp"

namespace orv::test {
namespace {

std::string toHex(std::span<const std::byte> bytes) {
  return test::toHex({reinterpret_cast<const char*>(bytes.data()), bytes.size()});
}

UnknownStorage make(std::string_view digits) {
  const std::string bytes = hex(digits);
  return UnknownStorage::checked(std::as_bytes(std::span(bytes))).value();
}

TEST(UnknownStorage, GivesItsFieldsOneByOne) {
  const UnknownStorage storage =
      make("88 00 81 00 1B 0A 01 61 1C FA FF FF FF 0F 02 41 42 0D 01 02 03 04 09 05*8");
  const struct {
    std::uint32_t number;
    WireType type;
    const char* record;
    const char* value;
  } expected[] = {
      {1, WireType::varint, "88 00 81 00", "81 00"},
      {3, WireType::startGroup, "1B 0A 01 61 1C", "0A 01 61 1C"},
      {0x1FFFFFFF, WireType::lengthDelimited, "FA FF FF FF 0F 02 41 42", "02 41 42"},
      {1, WireType::fixed32, "0D 01 02 03 04", "01 02 03 04"},
      {1, WireType::fixed64, "09 05 05 05 05 05 05 05 05", "05 05 05 05 05 05 05 05"},
  };
  std::size_t at = 0;
  for (const UnknownField& field : storage) {
    ASSERT_LT(at, std::size(expected));
    EXPECT_EQ(field.tag.fieldNumber(), expected[at].number);
    EXPECT_EQ(field.tag.wireType(), expected[at].type);
    EXPECT_EQ(toHex(field.record), expected[at].record);
    EXPECT_EQ(toHex(field.value), expected[at].value);
    ++at;
  }
  EXPECT_EQ(at, std::size(expected));
  auto second = storage.begin();
  second++;
  EXPECT_EQ(second->tag.fieldNumber(), 3U);
  EXPECT_TRUE(UnknownStorage().begin() == UnknownStorage().end());
}

TEST(UnknownStorage, TakesNoMalformedRecords) {
  for (const MalformedCase& row : malformedCases()) {
    SCOPED_TRACE(row.name);
    const std::string bytes = hex("28 01") + hex(row.input);
    const auto storage = UnknownStorage::checked(std::as_bytes(std::span(bytes)));
    ASSERT_FALSE(storage);
    EXPECT_EQ(describe(storage.error().cause), describe(row.cause));
    EXPECT_EQ(storage.error().offset, 2 + row.offset);
  }
  EXPECT_TRUE(UnknownStorage::checked({}).value().isEmpty());
}

TEST(UnknownStorage, IsAValue) {
  const UnknownStorage first = make("28 01"), second = make("28 02 28 03");
  UnknownStorage copy = first;
  EXPECT_EQ(copy, first);
  EXPECT_FALSE(copy == second || copy == UnknownStorage());
  ASSERT_TRUE(copy.append(second.records()));
  EXPECT_EQ(toHex(copy.records()), "28 01 28 02 28 03");
  EXPECT_EQ(toHex(first.records()), "28 01");
  ASSERT_TRUE(copy.append(copy.records()));
  ASSERT_TRUE(copy.append(copy.records()));
  EXPECT_EQ(copy.records().size(), 24U);
  EXPECT_EQ(toHex(copy.records().last(6)), "28 01 28 02 28 03");

  UnknownStorage moved = std::move(copy);
  EXPECT_EQ(moved.records().size(), 24U);
  copy = first;
  EXPECT_EQ(copy, first);
  const UnknownStorage& itself = copy;
  copy = itself;
  EXPECT_EQ(copy, first);
  copy = {};
  EXPECT_EQ(copy, UnknownStorage());
  ASSERT_TRUE(copy.append({}));
  EXPECT_TRUE(copy.isEmpty());
}

TEST(UnknownStorage, TellsOrderAndSpellingApart) {
  EXPECT_FALSE(make("28 01 30 02") == make("30 02 28 01"));
  EXPECT_FALSE(make("28 01") == make("28 81 00"));
}

TEST(UnknownStorage, WeighsAboutWhatItsRecordsWeigh) {
  const std::string record = hex("28 01");
  const HeapMeter meter;
  UnknownStorage storage;
  for (int count = 0; count < 100'000; ++count) ASSERT_TRUE(storage.append(std::as_bytes(std::span(record))));
  EXPECT_LT(meter.allocations(), 40U);
  EXPECT_LT(meter.liveBytes(), 310'000U);
  EXPECT_EQ(sizeof storage, sizeof(void*));
}

}  // namespace
}  // namespace orv::test

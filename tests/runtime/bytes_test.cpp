#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <utility>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/text.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

// Around the most that lives in the object, and around doublings.
constexpr std::size_t sizes[] = {0, 1, 16, 19, 20, 38, 39, 40, 41, 79, 80, 81, 255, 256, 1000};

std::string contents(std::size_t size) {
  std::string bytes(size, '\0');
  for (std::size_t at = 0; at < size; ++at) bytes[at] = static_cast<char>(at * 7 + size);
  return bytes;
}

internal::InlineBytes make(std::size_t size) {
  internal::InlineBytes bytes;
  bytes.assign(contents(size));
  return bytes;
}

TEST(InlineBytes, LiveInTheObjectUpTo39) {
  // Every size, since they are gathered in words of eight.
  for (std::size_t size = 0; size < 100; ++size) {
    const internal::InlineBytes bytes = make(size);
    EXPECT_EQ(bytes.view(), contents(size));
    EXPECT_EQ(bytes.size(), size);
    EXPECT_EQ(bytes.isOnHeap(), size > 39);
    std::string characters = contents(size);
    for (char& character : characters) character &= 0x7F;
    EXPECT_EQ(Text(characters).utf8(), characters);
  }
}

TEST(InlineBytes, AreCopiedMovedAndAssignedWhateverBothHeldBefore) {
  for (const std::size_t from : sizes) {
    for (const std::size_t to : sizes) {
      SCOPED_TRACE(std::to_string(from) + " to " + std::to_string(to));
      internal::InlineBytes source = make(from), target = make(to);
      target = source;
      EXPECT_EQ(target.view(), contents(from));
      EXPECT_EQ(source.view(), contents(from));
      source.append("x");
      EXPECT_EQ(target.view(), contents(from));

      internal::InlineBytes moved = std::move(target);
      EXPECT_EQ(moved.view(), contents(from));
      target.assign(contents(to));  // a moved-from object can be assigned to
      target = std::move(moved);
      EXPECT_EQ(target.view(), contents(from));
      moved = make(to);
      EXPECT_EQ(moved.view(), contents(to));
      target.assign(contents(to));
      EXPECT_EQ(target.view(), contents(to));
      target.append(contents(from));
      EXPECT_EQ(target.view(), contents(to) + contents(from));
    }
  }
}

TEST(InlineBytes, TakePartsOfThemselves) {
  for (const std::size_t size : sizes) {
    SCOPED_TRACE(size);
    internal::InlineBytes bytes = make(size);
    const internal::InlineBytes& itself = bytes;
    bytes = itself;
    EXPECT_EQ(bytes.view(), contents(size));
    bytes = std::move(const_cast<internal::InlineBytes&>(itself));
    EXPECT_EQ(bytes.view(), contents(size));
    bytes.append(bytes.view());
    EXPECT_EQ(bytes.view(), contents(size) + contents(size));
    bytes.append(bytes.view().substr(size / 2, size));
    EXPECT_EQ(bytes.view(),
              contents(size) + contents(size) + (contents(size) + contents(size)).substr(size / 2, size));
    bytes.assign(bytes.view().substr(size / 2, size));
    EXPECT_EQ(bytes.view(), (contents(size) + contents(size)).substr(size / 2, size));
  }
}

TEST(InlineBytes, TakeWhatFitsInsideFromReadableBytes) {
  for (std::size_t size = 0; size <= internal::InlineBytes::inlineCapacity; ++size) {
    std::string input(size, 'a');
    input.resize(internal::InlineBytes::objectSize, '\xFF');
    const std::vector<char> exact(input.begin(), input.end());  // sanitizers see reads behind its end
    const auto* const start = reinterpret_cast<const std::byte*>(exact.data());
    EXPECT_TRUE(internal::InlineBytes::isAsciiWithin(start, size));
    EXPECT_FALSE(internal::InlineBytes::isAsciiWithin(start, size + 1));
    for (const std::size_t before : {0U, 39U, 50U}) {
      internal::InlineBytes bytes = make(before);
      bytes.assignWithin(start, size);
      EXPECT_EQ(bytes.view(), std::string(size, 'a'));
    }
  }
}

TEST(InlineBytes, GrowInFewAllocations) {
  internal::InlineBytes bytes;
  const HeapMeter meter;
  for (int count = 0; count < 100'000; ++count) bytes.append("x");
  EXPECT_LT(meter.allocations(), 20U);
  EXPECT_EQ(bytes.size(), 100'000U);
}

TEST(InlineBytes, AreCopiedToTheirOwnSizeWhateverTheirBlockHolds) {
  internal::InlineBytes shrunk = make(1000);
  const std::string shorter = contents(39);
  shrunk.assign(shorter);
  EXPECT_TRUE(shrunk.isOnHeap());
  const HeapMeter meter;
  const internal::InlineBytes copy = shrunk;
  EXPECT_EQ(copy.view(), shorter);
  EXPECT_EQ(meter.allocations(), 0U);
}

TEST(ByteView, IsMadeOfAnyBytesInOnePiece) {
  char characters[] = {'a', '\0'};
  const unsigned char octets[] = {'a', 0};
  std::array<std::byte, 2> array{std::byte{'a'}};
  const std::string string("a\0", 2);
  const std::vector<std::uint8_t> vector{'a', 0};
  const ByteBuffer buffer = vector;
  const std::pair<const char*, ByteView> views[] = {
      {"array of characters", characters},
      {"array of octets", octets},
      {"std::array", array},
      {"std::string", string},
      {"std::string_view", std::string_view(string)},
      {"std::vector", vector},
      {"span of fixed size", std::span(array)},
      {"span of octets", std::span<const std::uint8_t>(octets)},
      {"ByteBuffer", buffer},
      {"literal", "a\0"},
      {"literal of UTF-8", u8"a\0"},
      {"literal of bytes", "a\0"_bytes},
  };
  for (const auto& [name, view] : views) {
    EXPECT_EQ(view.characters(), string) << name;
    EXPECT_EQ(ByteBuffer(view), string) << name;
  }
  EXPECT_EQ(ByteBuffer(characters), string);
  EXPECT_EQ(ByteBuffer(u8"a\0"), "a\0"_bytes);
  EXPECT_EQ(ByteView().size(), 0U);
  EXPECT_EQ(ByteView("").size(), 0U);

  // A pointer has no end, numbers of several bytes no one order, and a bool is no byte.
  static_assert(
      !std::convertible_to<const char*, ByteView> && !std::convertible_to<std::nullptr_t, ByteView> &&
      !std::constructible_from<ByteBuffer, const char*> && !std::convertible_to<std::vector<int>, ByteView> &&
      !std::convertible_to<std::array<bool, 2>, ByteView> && !std::convertible_to<Text, ByteView>);
}

TEST(ByteBuffer, IsARangeAndComparesWithOthers) {
  const ByteBuffer buffer = std::vector<std::uint8_t>{0, 0x7F, 0xFF};
  const std::byte bytes[] = {std::byte{0}, std::byte{0x7F}, std::byte{0xFF}};
  EXPECT_TRUE(std::ranges::equal(buffer, bytes));
  EXPECT_EQ(buffer.data(), buffer.bytes().data());
  EXPECT_TRUE(buffer == bytes && bytes == buffer && buffer == ByteView(bytes).bytes());
  EXPECT_TRUE(buffer != "\0\x7F"_bytes && !buffer.empty());
  // As unsigned bytes, a beginning before the whole.
  const ByteBuffer ascending[] = {"", "\0"_bytes, "\0\0"_bytes, "\0\x7F"_bytes, buffer, "\x80"_bytes};
  EXPECT_TRUE(std::ranges::is_sorted(ascending, std::ranges::less_equal()));
}

TEST(ByteBuffer, ComparesLengthAndBytes) {
  const ByteBuffer buffer(std::string_view("\0\xFF", 2));
  EXPECT_EQ(buffer, ByteBuffer(buffer.bytes()));
  EXPECT_FALSE(buffer == ByteBuffer(std::string_view("\0", 1)));
  EXPECT_FALSE(buffer == ByteBuffer(std::string_view("\0\xFE", 2)));
  EXPECT_FALSE(ByteBuffer("\u00E9") == ByteBuffer("e\u0301"));
  EXPECT_EQ(buffer[1], std::byte{0xFF});
  EXPECT_EQ((buffer + buffer).size(), 4U);
  EXPECT_TRUE(ByteBuffer().isEmpty() && ByteBuffer(std::span<const std::byte>()).isEmpty());
}

TEST(ByteBuffer, OfAUuidAllocatesNothing) {
  const std::string uuid(16, 'u');
  const HeapMeter meter;
  const ByteBuffer buffer(uuid);
  ByteBuffer copy = buffer;
  copy = ByteBuffer(uuid);
  EXPECT_EQ(meter.allocations(), 0U);
}

}  // namespace
}  // namespace orv::test

#include <gtest/gtest.h>

#include <orv/byte_buffer.hpp>
#include <orv/internal/inline_bytes.hpp>
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
  for (const std::size_t size : sizes) {
    const internal::InlineBytes bytes = make(size);
    EXPECT_EQ(bytes.view(), contents(size));
    EXPECT_EQ(bytes.size(), size);
    EXPECT_EQ(bytes.isOnHeap(), size > 39);
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

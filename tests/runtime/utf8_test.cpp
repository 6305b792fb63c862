#include <orv/utf8.hpp>

#include <gtest/gtest.h>
#include <utf8proc.h>

#include "tests/testing/hex.hpp"
#include "tests/testing/utf8.hpp"

namespace orv::test {
namespace {

// How many bytes at the start another library takes for well-formed.
std::size_t expectedPrefix(std::string_view text) {
  std::size_t at = 0;
  while (at < text.size()) {
    utf8proc_int32_t codePoint;
    const auto* const bytes = reinterpret_cast<const utf8proc_uint8_t*>(text.data());
    const auto length =
        utf8proc_iterate(bytes + at, static_cast<utf8proc_ssize_t>(text.size() - at), &codePoint);
    if (length <= 0) break;
    at += static_cast<std::size_t>(length);
  }
  return at;
}

// Counts, since a check for each of the millions would take long.
void countFault(std::string_view text, std::size_t& faults) {
  const std::size_t expected = expectedPrefix(text);
  const bool isRight = utf8::wellFormedPrefix(text) == expected;
  if (!isRight && faults++ < 10) ADD_FAILURE() << toHex(text);
}

TEST(Utf8, IsWellFormedWhereAnotherLibrarySaysSo) {
  std::size_t faults = 0;
  for (std::size_t size = 1; size <= 3; ++size) {
    for (std::size_t all = 0; all < std::size_t{1} << (8 * size); ++all) {
      std::array<char, 3> text;
      for (std::size_t at = 0; at < size; ++at) text[at] = static_cast<char>(all >> (8 * at));
      countFault({text.data(), size}, faults);
    }
  }
  const std::string ends = hex("00 41 7F 80 8F 90 9F A0 BF C0 C2 E0 F4 FF");
  for (int lead = 0xE0; lead < 0x100; ++lead) {
    for (int second = 0; second < 0x100; ++second) {
      for (const char third : ends) {
        for (const char fourth : ends) {
          const std::string text{static_cast<char>(lead), static_cast<char>(second), third, fourth};
          countFault(text, faults);
          countFault("eight by" + text + "tes at a time", faults);
        }
      }
    }
  }
  // In a block, of which all bytes are looked at together.
  for (int lead = 0x80; lead < 0x100; ++lead) {
    for (int second = 0; second < 0x100; ++second) {
      for (const char* const tail : {"", "\x80", "\x80\x80", "\xBF\xC0", "\xBF\xBF\x80"}) {
        const std::string text{static_cast<char>(lead), static_cast<char>(second)};
        countFault(std::string(50, 'a') + text + tail + std::string(50, 'a'), faults);
      }
    }
  }
  EXPECT_EQ(faults, 0U);
}

TEST(Utf8, IsCheckedToTheLastByteWhateverTheLength) {
  for (std::size_t size = 1; size < 100; ++size) {
    for (std::size_t at = 0; at < size; ++at) {
      std::string text(size, 'a');
      EXPECT_TRUE(utf8::isAscii(text));
      text[at] = '\x80';
      EXPECT_FALSE(utf8::isAscii(text));
      EXPECT_FALSE(utf8::isWellFormed(text));
      EXPECT_EQ(utf8::wellFormedPrefix(text), at);
    }
  }
}

TEST(Utf8, IsRefusedWhereABlockHasNoBeginningOfALetter) {
  for (const char* const start : {"", "a", "\xC3", "\xF4"}) {
    const std::string text = std::string(64, 'a') + start + std::string(200, '\x80');
    EXPECT_EQ(utf8::wellFormedPrefix(text), expectedPrefix(text));
  }
}

TEST(Utf8, IsWrittenAndReadBackForEveryCodePoint) {
  std::size_t faults = 0;
  for (char32_t codePoint = 0; codePoint <= 0x10FFFF; ++codePoint) {
    if (codePoint >= 0xD800 && codePoint < 0xE000) continue;
    std::string text;
    appendUtf8(codePoint, text);
    const utf8::Step step = utf8::step(text);
    if (!step.isWellFormed || step.codePoint != codePoint || step.length != text.size()) ++faults;
  }
  EXPECT_EQ(faults, 0U);
}

}  // namespace
}  // namespace orv::test

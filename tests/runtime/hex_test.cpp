// Bytes out of whatever is pasted.
#include <orv/spelling/hex.hpp>

#include <gtest/gtest.h>

#include <string>

#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

// The bytes, or else where the text goes wrong and how; read in pieces of so many characters.
std::string outcome(std::string_view text, std::size_t pieceSize) {
  spelling::HexReader reader;
  std::string bytes;
  for (; !text.empty(); text.remove_prefix(std::min(pieceSize, text.size()))) {
    if (const auto taken = reader.take(text.substr(0, pieceSize), bytes); !taken)
      return taken.error().message();
  }
  const auto finished = reader.finish(bytes);
  return finished ? toHex(bytes) : finished.error().message();
}

TEST(HexReader, ReadsWhateverIsPasted) {
  struct Case {
    std::string_view name;
    std::string_view text;
    std::string_view outcome;
  };
  const Case cases[] = {
      {"nothing", " \n", ""},
      {"pairs", "0aFF 00\t1\x30\r\n", "0A FF 00 10"},
      {"pairs with commas", "0a, ff,00;", "0A FF 00"},
      {"pairs with colons", "0a:ff:00", "0A FF 00"},
      {"pairs with hyphens", "0a-ff-00", "0A FF 00"},
      {"prefixes", "0x0a 0XFF,0x1 0x0203", "0A FF 01 02 03"},
      {"escapes", "\\x0a\\xff \\x1,\\012\\0\\n", "0A FF 01 0A 00 0A"},
      {"a string", "\"\\012\\377an\\\"n\\x41\" 'b'\n\"c\"", "0A FF 61 6E 22 6E 41 62 63"},
      {"bytes of Python", "b'\\n\\xffann'", "0A FF 61 6E 6E"},
      {"an array", "unsigned char ab[] = {\n  0x0a, 0xff,\n 0x1};\nunsigned int ab_len = 3;\n", "0A FF 01"},
      {"an array's numbers alone", "{0x0a, {0xff}, 0x1}", "0A FF"},
      {"xxd", "00000000: 0aff 0061  ...a\n00000004: 62                                       b\n",
       "0A FF 00 61 62"},
      {"xxd from the middle", "00000010: 0aff  ab\n00000012: 61  a\n", "0A FF 61"},
      {"tcpdump", "\t0x0000:  0aff 0061  ...a\n\t0x0004:  62       b\n", "0A FF 00 61 62"},
      {"hexdump",
       "00000000  0a 03 61 6e 6e 00 00 00  00 00 00 00 00 00 00 41  |..ann..........A|\n"
       "00000010  62                                                |b|\n00000011\n",
       "0A 03 61 6E 6E 00 00 00 00 00 00 00 00 00 00 41 62"},
      {"od",
       "0000000 0a 00 00 00 00 00 00 00 00 00 00 00 00 00 00 41  >abcdefghijklmnop<\n0000020 62\n0000021\n",
       "0A 00 00 00 00 00 00 00 00 00 00 00 00 00 00 41 62"},
      {"Wireshark", "0000   0a 03 61 6e 6e 00 00 00 00 00   ..ann.....\n000a   62   b",
       "0A 03 61 6E 6E 00 00 00 00 00 62"},
      {"no digit", "0a\n0g", "line 2, column 2: \"g\" is no hexadecimal digit"},
      {"no digit at all", "0a {", "line 1, column 4: \"{\" is no hexadecimal digit"},
      {"half a byte", "0a 0", "line 1, column 5: half a byte: an odd number of hexadecimal digits"},
      {"half a byte before a blank", "0a 0 1",
       "line 1, column 5: half a byte: an odd number of hexadecimal digits"},
      {"prefix alone", "0x", "line 1, column 3: byte 0x00 is no hexadecimal digit"},
      {"no escape", "\\q", "line 1, column 1: an escape that C does not have"},
      {"characters between escapes", "\\x0aab",
       "line 1, column 5: characters between escapes need quotation marks"},
      {"string without an end", "'\\n", "line 1, column 4: a string without its closing quotation mark"},
      {"string over a line's end", "'a\nb'", "line 1, column 3: a string without its closing quotation mark"},
      {"lines left out", "00000000  0a  |.|\n*\n00000020\n", "line 2, column 1: the dump leaves lines out"},
      {"a line that is missing", "00000000: 0aff  ab\n00000010: 61  a\n",
       "line 2, column 1: not the offset of the next byte, 0x0002"},
      {"a line without offset", "00000000: 0aff  ab\n61\n", "line 2, column 1: the line has no offset"},
      {"words of hexdump", "0000000 ff0a 6100\n",
       "line 1, column 9: bytes in groups, whose order is not known"},
  };
  for (const Case& each : cases) {
    for (const std::size_t pieceSize : {1U, 7U, 10'000U})
      EXPECT_EQ(outcome(each.text, pieceSize), each.outcome) << each.name << ", in pieces of " << pieceSize;
  }
}

TEST(HexReader, ReadsLongLinesInPieces) {
  spelling::HexReader reader;
  std::string bytes;
  const std::string line(100'000, '1');
  ASSERT_TRUE(reader.take(line, bytes).has_value());
  EXPECT_GT(bytes.size(), 40'000U);
  ASSERT_TRUE(reader.finish(bytes).has_value());
  EXPECT_EQ(bytes, std::string(50'000, '\x11'));
}

}  // namespace
}  // namespace orv::test

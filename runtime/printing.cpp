// How values are written to streams. A stream's error is printed where streams are, since every message can be
// printed and every program would link them.
#include <orv/internal/printing.hpp>

#include <ostream>
#include <string>

#include <orv/byte_buffer.hpp>
#include <orv/decode_error.hpp>
#include <orv/encode_error.hpp>
#include <orv/internal/hex_digits.hpp>
#include <orv/text.hpp>

namespace orv::inline v0 {

std::ostream& internal::print(std::ostream& out, std::string_view characters) { return out << characters; }

std::ostream& internal::printName(std::ostream& out, NameMap names, std::int64_t number) {
  const auto name = names.name(number);
  return name ? out << *name : out << number;
}

std::ostream& operator<<(std::ostream& out, const Text& text) { return out << text.utf8(); }

std::ostream& operator<<(std::ostream& out, const ByteBuffer& buffer) {
  std::string digits;
  digits.reserve(2 * buffer.size());
  for (const char character : buffer.characters()) {
    const auto byte = static_cast<unsigned char>(character);
    digits += {internal::hexDigits[byte >> 4], internal::hexDigits[byte & 0xF]};
  }
  return out << digits;
}

std::ostream& operator<<(std::ostream& out, const IllFormedText& error) { return out << error.message(); }

std::ostream& operator<<(std::ostream& out, DecodeCause cause) { return out << describe(cause); }
std::ostream& operator<<(std::ostream& out, const FieldPath& path) { return out << path.text(); }
std::ostream& operator<<(std::ostream& out, const DecodeError& error) { return out << error.message(); }

std::ostream& operator<<(std::ostream& out, EncodeError error) { return out << describe(error); }

}  // namespace orv

// What is wrong with bytes that are no message, and where.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <iosfwd>
#include <span>
#include <string>
#include <string_view>

#include <orv/descriptor.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

// What can be wrong with bytes.
enum class DecodeCause : std::uint8_t {
  truncated,           // the input, or the enclosing message, ends inside a record
  lengthOverrun,       // a length runs past the end of the input or of the enclosing message
  lengthTooLarge,      // a length of 2^31 or more, or spelled in more than five bytes
  malformedTag,        // a tag of more than five bytes or above 2^32-1
  fieldNumberZero,     // a tag with field number 0
  reservedWireType,    // a tag with wire type 6 or 7
  malformedVarint,     // a varint of more than ten bytes
  unexpectedEndGroup,  // an end-group tag where no group is open
  mismatchedEndGroup,  // an end-group tag with another number than its start
  unterminatedGroup,   // a group without its end
  illFormedText,       // a text field that is not well-formed UTF-8
  nestingTooDeep,      // messages and groups nested deeper than 100, or than the program's limit
  conflictingOneOf,    // for conflict hooks that refuse; the decoder itself never does
  inputTooLarge,       // more bytes of input than the program's limit
  tooManyElements,     // more elements of lists
  tooMuchUnknown,      // more bytes of unknown fields
};

// A sentence without its full stop, for instance "varint of more than ten bytes". It lasts as long as the
// program.
std::string_view describe(DecodeCause cause);
std::ostream& operator<<(std::ostream& out, DecodeCause cause);

// Where a field stands in a message tree: the outermost message, then field numbers. A plain value that
// allocates nothing and owns nothing: names are looked up when they are asked for.
class FieldPath {
 public:
  // Steps beyond this many are left out, the innermost first.
  static constexpr std::size_t capacity = 5;

  // The path from the outermost message over these fields, the outermost first. Number 0 stands for no field:
  // it is where a message has none. What is deeper than `capacity` is left out and counted in `omitted`.
  void assign(const MessageDescriptor& outermost, std::span<const std::uint32_t> numbers,
              std::size_t omitted) {
    outermost_ = &outermost;
    size_ = static_cast<std::uint16_t>(numbers.size());
    omitted_ = static_cast<std::uint16_t>(omitted);
    for (std::size_t at = 0; at < numbers.size(); ++at) numbers_[at] = numbers[at];
  }

  bool isEmpty() const { return outermost_ == nullptr; }
  // For instance "orv.Group.memberAdded.member.handle"; a field that has no name is written by its number.
  std::string text() const;

  friend bool operator==(const FieldPath&, const FieldPath&) = default;
  friend std::ostream& operator<<(std::ostream& out, const FieldPath& path);

 private:
  const MessageDescriptor* outermost_ = nullptr;
  std::array<std::uint32_t, capacity> numbers_{};
  std::uint16_t size_ = 0;
  std::uint16_t omitted_ = 0;
};

// The error of BinaryDecoder. A plain value: making and copying it allocates nothing.
struct DecodeError {
  DecodeCause cause = DecodeCause::truncated;
  // For lengthOverrun: the length, and by how many bytes it overruns. For illFormedText: the text's length,
  // and the offset of the first ill-formed byte in it. For nestingTooDeep: how deep they may be. All are
  // below 2^31.
  std::uint32_t length = 0;
  std::uint32_t detail = 0;
  // Where in the input the offending tag, varint, length or text begins; for what is missing, where it was
  // missed.
  std::size_t offset = 0;
  FieldPath path{};

  // What is wrong, without path and offset: "length 23 runs 19 bytes past the end".
  std::string reason() const;
  // All of it: "orv.Group.memberAdded.member.handle: length 23 runs 19 bytes past the end, at byte 12".
  std::string message() const;

  friend bool operator==(const DecodeError&, const DecodeError&) = default;
  friend std::ostream& operator<<(std::ostream& out, const DecodeError& error);
};

}  // namespace orv

template <>
class std::bad_expected_access<orv::DecodeError> : public orv::internal::BadAccess<orv::DecodeError> {
  using BadAccess::BadAccess;
};

// Writes messages in their binary encoding.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <expected>
#include <span>
#include <string>
#include <vector>

#include <orv/encode_error.hpp>
#include <orv/internal/field_writer.hpp>

namespace orv::inline v0 {

// A visitor that writes what it is handed, in one pass:
//
//   std::string bytes;
//   BinaryEncoder encoder(bytes);
//   const auto result = message.traverse(encoder);
//
// (serialize and serializeInto are the same in one call.) A nested message is written behind as many length
// bytes as it will likely need, and moved in the rare case that it needs another number of them.
//
// It has the operations that Visitor lists, for visitors that hand on to it. They answer only whether they
// succeeded; error() says what was wrong.
class BinaryEncoder : private internal::Target, public internal::FieldWriter {
 public:
  using internal::Target::largestEncoding;

  // Appends to `output`, which holds the bytes once finish() was called or the encoder is gone, and which must
  // outlive it. After a failure nothing is appended.
  explicit BinaryEncoder(std::string& output)
      : Target{.begin = output.data() + output.size(), .growing = &output},
        FieldWriter({begin, std::size_t{0}}, *this),
        sizeBefore_(output.size()) {}

  // Writes from the start of `buffer`, which stays the caller's; what is behind the encoding may change.
  explicit BinaryEncoder(std::span<std::byte> buffer)
      : Target{.begin = reinterpret_cast<char*>(buffer.data()), .guessing = Guesses::careful},
        FieldWriter({begin, std::min(buffer.size(), largestEncoding)}, *this) {}

  BinaryEncoder(const BinaryEncoder&) = delete;
  BinaryEncoder& operator=(const BinaryEncoder&) = delete;
  ~BinaryEncoder() { finish(); }

  // How many bytes were written. A string that is appended to gets its final size.
  std::size_t finish() {
    const std::size_t written = isWhole_ ? static_cast<std::size_t>(position() - begin) : 0;
    if (growing != nullptr) growing->resize(sizeBefore_ + written);
    return written;
  }

  // Why an operation failed. Only for an encoder one of whose operations did.
  EncodeError error() const { return Target::error; }

  template <class M>
  internal::Step visitSingularMessageField(const M& message, std::uint32_t number) {
    return writeStep([&](FieldWriter& writer) { return writer.visitSingularMessageField(message, number); });
  }
  template <class M>
  internal::Step visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    return writeStep([&](FieldWriter& writer) { return writer.visitRepeatedMessageField(messages, number); });
  }

  // Walks the message with a writer that goes on where this encoder stands, which then stands where that one
  // ended. This is how the rules of all messages write with a visitor that the compiler can keep in
  // registers.
  template <class Walk>
  std::expected<void, EncodeError> writeWith(Walk walk) {
    FieldWriter writer = static_cast<const FieldWriter&>(*this);
    isWhole_ = false;
    if (!walk(writer)) return std::unexpected(error());
    isWhole_ = true;
    static_cast<FieldWriter&>(*this) = writer;
    return {};
  }

 private:
  template <class Walk>
  internal::Step writeStep(Walk walk) {
    if (writeWith(walk)) return {};
    return std::unexpected(internal::Failed());
  }

  bool isWhole_ = true;         // every message was written to its end
  std::size_t sizeBefore_ = 0;  // of the string that is appended to
};

}  // namespace orv

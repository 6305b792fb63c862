// Input in pieces of one message each.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <orv/spelling/text_position.hpp>
#include "tools/orv/failure.hpp"
#include "tools/orv/input/input_file.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// "byte 12 (0x000c)"
std::string bytePlace(std::uint64_t offset);

// One message as it stands in the input: its encoding, or its text.
struct Frame {
  std::string_view content{};  // valid until the next frame is read
  std::uint64_t number = 0;    // of the message in a stream, from 1; 0 for input that is one message
  std::uint64_t offset = 0;  // of the content, in bytes of the input (of what it spells, for hex and base64)
  // Of the content's beginning in text, both from 1.
  std::size_t line = 1;
  std::size_t column = 1;
};

// Reads frame after frame, and keeps one of them in memory.
class FrameReader {
 public:
  // The file must outlive the reader. The options say whether it is a stream, and the most bytes of a message.
  static std::unique_ptr<FrameReader> make(InputFile& file, Format format, const Options& options);

  virtual ~FrameReader() = default;
  // None at the end of the input.
  [[nodiscard]] virtual Outcome<std::optional<Frame>> next() = 0;

  // A failure in this frame: "file: message 3: byte 140 (0x008c): reason". The offset counts from the frame's
  // first byte.
  Failure malformedBytes(const Frame& frame, std::uint64_t offset, std::string_view reason) const;
  // "file: message 3: line 17, column 4: reason"; the error's place counts from the frame's.
  Failure malformedText(const Frame& frame, spelling::TextError error) const;
  // "file: message 3: reason"
  Failure malformed(const Frame& frame, std::string_view reason) const;

 protected:
  // A message may have so many bytes.
  FrameReader(std::string fileName, std::size_t maximumSize)
      : fileName_(std::move(fileName)), maximumSize_(maximumSize) {}

  std::size_t maximumSize() const { return maximumSize_; }
  std::unexpected<Failure> failTooLarge(const Frame& frame) const;

 private:
  std::string fileName_;
  std::size_t maximumSize_;
};

}  // namespace orv::tool

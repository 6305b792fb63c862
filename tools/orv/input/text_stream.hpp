// Streams of JSON documents or of messages in the text format.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "tools/orv/input/frame_reader.hpp"
#include "tools/orv/input/input_file.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// A line that begins so stands before each message of a stream in the text format, which takes it as a
// comment.
inline constexpr std::string_view textSeparator = "# message";

// Cuts a stream into the texts of its messages. A JSON document ends where its last bracket is closed, so several
// on one line and one on several lines will both do; a message in the text format begins with a line that begins
// with textSeparator, or with what stands before the first of these, and ends before the next.
class TextStream final : public FrameReader {
 public:
  // The file must outlive the stream.
  TextStream(InputFile& file, Format format, std::size_t maximumSize)
      : FrameReader(file.name(), maximumSize), file_(file), isJson_(format == Format::json) {}

  Outcome<std::optional<Frame>> next() override;

 private:
  // What was read and not handed out.
  std::string_view rest() const { return std::string_view(buffer_).substr(taken_); }
  // How long the first message in the rest is; none if it does not end there. Where it was looked for once, it is
  // not looked for again.
  std::optional<std::size_t> findEnd();
  std::optional<std::size_t> findEndOfDocument();
  // Reads more behind the rest; false at the end of the stream.
  Outcome<bool> readMore();
  // Leaves so many bytes of the rest behind.
  void drop(std::size_t size);

  InputFile& file_;
  bool isJson_;
  std::string buffer_;
  std::size_t taken_ = 0;
  std::size_t searched_ = 0;  // of the rest
  bool isAtEnd_ = false;
  Frame frame_;  // the one that was handed out; its place is that of the rest
  // In a document, behind what was searched.
  std::size_t depth_ = 0;
  bool isInString_ = false;
  bool isEscaped_ = false;
};

}  // namespace orv::tool

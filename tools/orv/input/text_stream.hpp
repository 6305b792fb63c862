// Streams of JSON documents or of messages in the text format.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "tools/orv/input/input_file.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// A line that begins so stands before each message of a stream in the text format, which takes it as a
// comment.
inline constexpr std::string_view textSeparator = "# message";

// Cuts a stream into the texts of its messages. A JSON document ends with the line in which its last bracket
// is closed, so one document a line and documents of several lines will both do; a message in the text format
// ends before a line that begins with textSeparator.
class TextStream {
 public:
  enum class Step : std::uint8_t { text, end, readFailed, tooLarge };

  // The file must outlive the stream.
  TextStream(InputFile& file, Format format, std::size_t maximumSize)
      : file_(file), isJson_(format == Format::json), maximumSize_(maximumSize) {}

  Step next();

  // After Step::text: the message, valid until the next call, and where in the stream it begins.
  std::string_view text() const { return text_; }
  std::uint64_t offset() const { return offset_; }
  std::size_t line() const { return line_; }

 private:
  // Puts the next line into line, with its end; empty at the end of the stream.
  Step readLine(std::string& line);
  Step nextDocument();
  Step nextText();
  void startAtNextLine();

  InputFile& file_;
  bool isJson_;
  std::size_t maximumSize_;
  std::string buffer_;  // read, from taken_ on not yet cut into lines
  std::size_t taken_ = 0;
  std::uint64_t nextOffset_ = 0;  // of the line that is read next
  std::size_t nextLine_ = 1;
  std::string text_;
  std::uint64_t offset_ = 0;
  std::size_t line_ = 1;
  bool isBehindSeparator_ = false;  // the separator before the next message has been read
};

}  // namespace orv::tool

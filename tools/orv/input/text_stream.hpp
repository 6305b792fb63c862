// Streams of JSON documents or of messages in the text format.
#pragma once

#include <cstddef>
#include <cstdint>
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

// Cuts a stream into the texts of its messages. A JSON document ends with the line in which its last bracket
// is closed, so one document a line and documents of several lines will both do; a message in the text format
// ends before a line that begins with textSeparator.
class TextStream final : public FrameReader {
 public:
  // The file must outlive the stream.
  TextStream(InputFile& file, Format format, std::size_t maximumSize)
      : FrameReader(file.name(), maximumSize), file_(file), isJson_(format == Format::json) {}

  Outcome<std::optional<Frame>> next() override;

 private:
  // Both gather the lines of the next message; false at the end of the stream.
  Outcome<bool> gatherDocument();
  Outcome<bool> gatherText();
  // Puts the next line into `line`, with its end; false at the end of the stream.
  Outcome<bool> readLine(std::string& line);
  void startAtNextLine();
  Outcome<void> add(std::string_view line);

  InputFile& file_;
  bool isJson_;
  std::string buffer_;  // read, from taken_ on not yet cut into lines
  std::size_t taken_ = 0;
  std::uint64_t nextOffset_ = 0;  // of the line that is read next
  std::size_t nextLine_ = 1;
  Frame frame_;  // the message that is being gathered in text_
  std::string text_;
  bool isBehindSeparator_ = false;  // the separator before the next message has been read
};

}  // namespace orv::tool

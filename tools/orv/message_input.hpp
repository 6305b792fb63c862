// Messages out of frames of any format.
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "tools/orv/failure.hpp"
#include "tools/orv/format.hpp"
#include "tools/orv/frame_reader.hpp"
#include "tools/orv/input_file.hpp"
#include "tools/orv/message_value.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// Reads the messages of one input file.
class MessageInput {
 public:
  // All must outlive the input. The options say type and payloads.
  MessageInput(FrameReader& reader, Format format, const Options& options)
      : reader_(reader), format_(format), options_(options) {}

  // The next message; false at the end of the input.
  Outcome<bool> next();

  const Frame& frame() const { return frame_; }

  // The message's binary encoding: as it came if it came as bytes, and then not yet checked.
  std::string_view encoding() const { return encoding_; }

  // Fails unless the encoding is a message, which is in doubt where it came as bytes. What an envelope holds
  // is not looked at.
  Outcome<void> check() const;

  // The message with its envelope opened. Where an envelope in text or JSON has its data as a string of bytes
  // that are not the payload they should be, it stays closed.
  Outcome<AnyMessage> message() const;

  // The failure for an error in the encoding.
  Failure failureOf(const DecodeError& error) const;

 private:
  Outcome<void> encodeText();
  Outcome<void> encodeJson();

  FrameReader& reader_;
  Format format_;
  const Options& options_;
  Frame frame_{};
  std::string encoded_;  // of a message that came as text
  std::string_view encoding_;
};

// A file that was opened for its messages, in the format that the options say, binary unless they do.
struct MessageFile {
  // The options must outlive it.
  static Outcome<MessageFile> open(const std::string& path, const Options& options);

  Format format;
  std::unique_ptr<InputFile> file;
  std::unique_ptr<FrameReader> frames;
  std::unique_ptr<MessageInput> messages;
};

}  // namespace orv::tool

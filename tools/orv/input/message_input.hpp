// Messages out of files of any format, and the loop over files and their messages that several subcommands share.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "tools/orv/failure.hpp"
#include "tools/orv/input/frame_reader.hpp"
#include "tools/orv/input/input_file.hpp"
#include "tools/orv/messages/message_value.hpp"
#include "tools/orv/options.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {

// Reads the messages of one input file, one after the other.
class MessageInput {
 public:
  // The options, which must outlive the input, say type, payloads and format; without a format it is guessed
  // from what the input begins with. So must the output, which is written before more input is
  // waited for.
  static Outcome<std::unique_ptr<MessageInput>> open(const std::string& path, const Options& options,
                                                     OutputFile& output);

  // The next message that the options select; false at the end of the input, or behind the last that they take.
  Outcome<bool> next();

  // As the command line names the file.
  const std::string& path() const { return path_; }
  // As errors name it.
  const std::string& name() const { return file_.name(); }
  const Frame& frame() const { return frame_; }

  // The message's binary encoding: as it came if it came as bytes, and then not yet checked.
  std::string_view encoding() const { return encoding_; }
  // Where it begins in the input; 0 for the encoding of a message that came as text.
  std::uint64_t encodingOffset() const { return isBytes(format_) ? frame_.offset : 0; }

  // Fails unless the encoding is a message, which is in doubt where it came as bytes. What an envelope holds
  // is not looked at.
  Outcome<void> check() const;

  // The message with its envelope opened. Where an envelope in text or JSON has its data as a string of bytes
  // that are not the payload they should be, it stays closed.
  Outcome<OwnedMessage> message() const { return message(options_.payloads); }
  Outcome<OwnedMessage> message(const PayloadPairing& payloads) const;

  // The failure for an error in the encoding: in a part of it, where the message without the part is none.
  Failure failureOf(const DecodeError& error) const;

 private:
  MessageInput(InputFile file, const std::string& path, const Options& options);
  Outcome<bool> nextFrame();
  bool isSelected() const;
  Outcome<std::string> encodeText() const;
  Outcome<std::string> encodeJson() const;
  std::unexpected<Failure> failText(spelling::TextError error) const;

  InputFile file_;
  const std::string& path_;
  const Options& options_;
  Format format_;
  std::unique_ptr<FrameReader> reader_;
  Frame frame_;
  std::string encoded_;  // of a message that came as text
  std::string_view encoding_;
};

// What a subcommand does with messages.
class MessageWork {
 public:
  // Takes the message that the input stands at.
  virtual Outcome<void> take(const MessageInput& message) = 0;
  // A file ends in a piece that is no message.
  virtual Outcome<void> takeEnd(const Failure&) { return {}; }
  // There are no more files. The output of malformed input stays where it is what was asked for.
  virtual Outcome<void> finish() { return {}; }
  virtual bool showsErrors() const { return false; }

 protected:
  ~MessageWork() = default;
};

// Hands out the messages of all files, one after the other, and writes what the work left in the output. What
// fails is reported, behind the output that came before. A file ends with its first malformed message, or goes on
// behind it where that was asked for or only a part is malformed, and the malformed ones of a stream are counted in
// the end. Files go on behind one that fails; the first failure gives the status.
ExitStatus forEachMessage(const Options& options, OutputFile& output, MessageWork& work);

template <class Work>
ExitStatus forEachMessage(const Options& options) {
  OutputFile output(options.output);
  Work work(options, output);
  return forEachMessage(options, output, work);
}

}  // namespace orv::tool

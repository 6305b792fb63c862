// The loop over files and their messages that several subcommands share.
#pragma once

#include <expected>
#include <string>

#include "tools/orv/failure.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/options.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {

// What a subcommand does with messages.
class MessageWork {
 public:
  // Takes the message that the input stands at.
  virtual Outcome<void> take(const MessageInput& message) = 0;
  // A file ends in a piece that is no message.
  virtual Outcome<void> takeEnd(const Failure&) { return {}; }

 protected:
  ~MessageWork() = default;
};

// Hands out the messages of all files, one after the other, and writes what the work left in the output. A
// file that fails is reported, behind the output that came before, and the others go on; the first failure
// gives the status.
ExitStatus forEachMessage(const Options& options, OutputFile& output, MessageWork& work);

}  // namespace orv::tool

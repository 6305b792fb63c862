// Messages into any format.
#pragma once

#include <string>
#include <string_view>

#include "tools/orv/failure.hpp"
#include "tools/orv/format.hpp"
#include "tools/orv/message_input.hpp"
#include "tools/orv/output_file.hpp"

namespace orv::tool {

class MessageOutput {
 public:
  // The file must outlive the output. The options say whether the output is a stream, and what JSON shows.
  MessageOutput(OutputFile& file, Format format, const Options& options);

  // Writes the message that the input stands at. A message that came as bytes is written to bytes as it came,
  // once it was checked.
  [[nodiscard]] Outcome<void> write(const MessageInput& input);

 private:
  Outcome<void> writeEncoding(const MessageInput& input);
  void appendText(const MessageInput& input, const MessageValue& message);

  OutputFile& file_;
  Format format_;
  const Options& options_;
  bool isFirst_ = true;
  std::string piece_;
};

}  // namespace orv::tool

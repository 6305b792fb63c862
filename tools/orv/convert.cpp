// decode, encode and convert.
#include <utility>

#include "tools/orv/commands.hpp"
#include "tools/orv/file_loop.hpp"
#include "tools/orv/message_input.hpp"
#include "tools/orv/message_output.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/progress.hpp"

namespace orv::tool {

namespace {

// What is not said is JSON when it begins as a document does, and the text format otherwise. An array is no
// message, but more likely meant for JSON than for an extension in the text format.
Format guessFormat(InputFile& file) {
  const auto first = file.firstVisibleCharacter();
  return first == '{' || first == '[' ? Format::json : Format::text;
}

// Reads one file to its end.
Outcome<void> convertFile(const std::string& path, const Options& options, MessageOutput& output,
                          OutputFile& file, Progress& progress) {
  auto input = InputFile::open(path);
  if (!input) return std::unexpected(std::move(input.error()));
  const Format format = options.from ? *options.from : guessFormat(*input);
  const auto frames = FrameReader::make(*input, {format, options.isDelimited, options.maximumSize});
  MessageInput messages(*frames, format, options);
  for (;;) {
    auto hasNext = messages.next();
    if (!hasNext) return std::unexpected(std::move(hasNext.error()));
    if (!*hasNext) return {};
    if (auto written = output.write(messages); !written) return written;
    if (file.isTerminal()) {
      if (auto flushed = file.flush(); !flushed) return flushed;
    }
    progress.update(messages.frame().number, messages.frame().offset);
  }
}

}  // namespace

ExitStatus runConvert(const Options& options) {
  OutputFile file(options.output);
  MessageOutput output(file, *options.to, options);
  Progress progress(file.isTerminal());
  return forEachFile(options, file, progress, [&](const std::string& path) {
    return convertFile(path, options, output, file, progress);
  });
}

}  // namespace orv::tool

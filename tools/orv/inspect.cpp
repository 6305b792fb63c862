// inspect.
#include <unistd.h>

#include <string>
#include <utility>

#include "tools/orv/commands.hpp"
#include "tools/orv/dump.hpp"
#include "tools/orv/file_loop.hpp"
#include "tools/orv/message_input.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/progress.hpp"

namespace orv::tool {

namespace {

std::string heading(const Options& options, const std::string& path, const MessageInput& messages) {
  std::string text;
  if (options.files.size() > 1) text += path + ": ";
  if (options.isDelimited) text += "message " + std::to_string(messages.frame().number) + ": ";
  text += options.type->fullName;
  return text + ", " + std::to_string(messages.encoding().size()) + " bytes";
}

// Where a stream ends in a piece that is no message, the dump says so too.
Outcome<void> showEnd(const Failure& failure, const DumpLayout& layout, OutputFile& output) {
  if (failure.status == ExitStatus::malformed) {
    std::string line;
    layout.appendError(line, failure.line);
    if (auto written = output.write(line); !written) return written;
  }
  return std::unexpected(failure);
}

Outcome<void> inspectFile(const std::string& path, const Options& options, const DumpLayout& layout,
                          OutputFile& output, Progress& progress) {
  const auto file = MessageFile::open(path, options);
  if (!file) return std::unexpected(file.error());
  MessageInput& messages = *file->messages;
  for (bool isFirst = true;; isFirst = false) {
    auto hasNext = messages.next();
    if (!hasNext) return showEnd(hasNext.error(), layout, output);
    if (!*hasNext) return {};
    std::string line = isFirst ? "" : "\n";
    layout.appendHeading(line, heading(options, path, messages));
    if (auto written = output.write(line); !written) return written;
    // The offsets of a message that came as text are those of its encoding.
    const std::uint64_t offset = isBytes(file->format) ? messages.frame().offset : 0;
    Dump dump(output, layout, std::as_bytes(std::span(messages.encoding())), offset);
    const auto shown = dump.show(*options.type, options.payloads);
    if (!shown) return std::unexpected(shown.error());
    if (shown->has_value()) return std::unexpected(messages.failureOf(**shown));
    if (output.isTerminal()) {
      if (auto flushed = output.flush(); !flushed) return flushed;
    }
    progress.update(messages.frame().number, messages.frame().offset);
  }
}

}  // namespace

ExitStatus runInspect(const Options& options) {
  OutputFile output(options.output);
  const int descriptor = options.output ? -1 : STDOUT_FILENO;
  const DumpLayout layout(terminalWidth(descriptor), Palette(options.colour, descriptor));
  Progress progress(output.isTerminal());
  return forEachFile(options, output, progress, [&](const std::string& path) {
    return inspectFile(path, options, layout, output, progress);
  });
}

}  // namespace orv::tool

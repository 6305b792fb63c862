#include "tools/orv/commands/message_loop.hpp"

#include "tools/orv/output/progress.hpp"

namespace orv::tool {

namespace {

Outcome<void> takeMessages(const std::string& path, const Options& options, OutputFile& output,
                           MessageWork& work, Progress& progress) {
  const auto opened = MessageInput::open(path, options);
  if (!opened) return std::unexpected(opened.error());
  MessageInput& input = **opened;
  const bool isTerminal = output.isTerminal();
  for (;;) {
    const auto hasNext = input.next();
    if (!hasNext) {
      if (auto taken = work.takeEnd(hasNext.error()); !taken) return taken;
      return std::unexpected(hasNext.error());
    }
    if (!*hasNext) return {};
    if (auto taken = work.take(input); !taken) return taken;
    if (isTerminal) {
      if (auto flushed = output.flush(); !flushed) return flushed;
    }
    progress.update(input.frame().number, input.frame().offset);
  }
}

}  // namespace

ExitStatus forEachMessage(const Options& options, OutputFile& output, MessageWork& work) {
  Progress progress(output.isTerminal());
  ExitStatus status = ExitStatus::done;
  for (const std::string& path : options.files) {
    Outcome<void> outcome = takeMessages(path, options, output, work, progress);
    progress.clear();
    if (outcome) continue;
    if (auto flushed = output.flush(); !flushed) outcome = std::unexpected(flushed.error());
    report(outcome.error());
    if (output.hasFailed()) return outcome.error().status;
    if (status == ExitStatus::done) status = outcome.error().status;
  }
  if (auto finished = status == ExitStatus::done ? output.finish() : output.flush(); !finished) {
    report(finished.error());
    return finished.error().status;
  }
  return status;
}

}  // namespace orv::tool

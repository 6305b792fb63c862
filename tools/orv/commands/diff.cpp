// diff.
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <utility>

#include <orv/compare.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/output/output_file.hpp"
#include "tools/orv/output/palette.hpp"
#include "tools/orv/output/progress.hpp"

namespace orv::tool {

namespace {

using compare::Difference;

class Comparison {
 public:
  Comparison(const Options& options, OutputFile& output)
      : options_(options), output_(output), palette_(options.colour, options.output ? -1 : STDOUT_FILENO) {}

  bool hasFoundDifferences() const { return hasFoundDifferences_; }
  // Whether nothing that may follow matters.
  bool isDecided() const { return hasFoundDifferences_ && options_.isQuiet; }

  // Compares the messages that both sides stand at.
  Outcome<void> compare(const MessageInput& before, const MessageInput& after) {
    const auto left = before.message();
    if (!left) return std::unexpected(left.error());
    const auto right = after.message();
    if (!right) return std::unexpected(right.error());
    for (const Difference& difference : compare::differencesOfLeaves((*left)->leaves(), (*right)->leaves())) {
      if (auto told = tell(before, difference); !told) return told;
    }
    if (!options_.comparesEncodings || before.encoding() == after.encoding()) return {};
    const auto mismatch = std::ranges::mismatch(before.encoding(), after.encoding());
    const auto at = static_cast<std::uint64_t>(mismatch.in1 - before.encoding().begin());
    return tell(before, {.kind = Difference::Kind::changed,
                         .path = "encoding",
                         .before = std::to_string(before.encoding().size()) + " bytes",
                         .after = std::to_string(after.encoding().size()) +
                                  " bytes, the first that differs is " + bytePlace(at)});
  }

  // A message that only one side has.
  Outcome<void> tellExtra(const MessageInput& extra, Difference::Kind kind) {
    const std::string size = std::to_string(extra.encoding().size()) + " bytes";
    return tell(extra, {kind, {}, size, size});
  }

 private:
  Outcome<void> tell(const MessageInput& messages, const Difference& difference) {
    const bool isFirst = !std::exchange(hasFoundDifferences_, true);
    if (options_.isQuiet) return {};
    std::string lines;
    if (isFirst) {
      palette_.append(lines, Palette::Colour::removed, "--- " + spelling::printable(options_.files[0]));
      lines += '\n';
      palette_.append(lines, Palette::Colour::added, "+++ " + spelling::printable(options_.files[1]));
      lines += '\n';
    }
    std::string place;
    if (options_.isDelimited) place = "message " + std::to_string(messages.frame().number) + ": ";
    if (!difference.path.empty()) place += difference.path + ": ";
    switch (difference.kind) {
      case Difference::Kind::changed:
        lines += "~ " + place;
        palette_.append(lines, Palette::Colour::removed, difference.before);
        lines += " -> ";
        palette_.append(lines, Palette::Colour::added, difference.after);
        break;
      case Difference::Kind::removed:
        palette_.append(lines, Palette::Colour::removed, "- " + place + difference.before);
        break;
      case Difference::Kind::added:
        palette_.append(lines, Palette::Colour::added, "+ " + place + difference.after);
        break;
    }
    lines += '\n';
    return output_.write(lines);
  }

  const Options& options_;
  OutputFile& output_;
  Palette palette_;
  bool hasFoundDifferences_ = false;
};

Outcome<void> compareFiles(const Options& options, OutputFile& output, Comparison& comparison,
                           Progress& progress) {
  const auto before = MessageInput::open(options.files[0], options, output);
  if (!before) return std::unexpected(before.error());
  const auto after = MessageInput::open(options.files[1], options, output);
  if (!after) return std::unexpected(after.error());
  MessageInput& left = **before;
  MessageInput& right = **after;
  while (!comparison.isDecided()) {
    const auto hasLeft = left.next();
    if (!hasLeft) return std::unexpected(hasLeft.error());
    const auto hasRight = right.next();
    if (!hasRight) return std::unexpected(hasRight.error());
    if (!*hasLeft && !*hasRight) return {};
    Outcome<void> compared;
    if (*hasLeft && *hasRight) {
      compared = comparison.compare(left, right);
    } else {
      compared = *hasLeft ? comparison.tellExtra(left, Difference::Kind::removed)
                          : comparison.tellExtra(right, Difference::Kind::added);
    }
    if (!compared) return compared;
    const Frame& frame = (*hasLeft ? left : right).frame();
    progress.update(frame.number, frame.offset);
  }
  return {};
}

}  // namespace

ExitStatus runDiff(const Options& options) {
  OutputFile output(options.output);
  Comparison comparison(options, output);
  Progress progress(output.isTerminal());
  auto outcome = compareFiles(options, output, comparison, progress);
  progress.clear();
  if (auto flushed = outcome ? output.finish() : output.flush(); !flushed) outcome = flushed;
  if (!outcome) {
    report(outcome.error());
    // Who reads no further has seen what differs.
    if (outcome.error().status != ExitStatus::done) return outcome.error().status;
  }
  return comparison.hasFoundDifferences() ? ExitStatus::different : ExitStatus::done;
}

}  // namespace orv::tool

// diff.
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <optional>
#include <string>
#include <utility>
#include <vector>

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

// A message that waits for the one that it belongs to.
struct Item {
  std::uint64_t number;  // in its stream
  std::string encoding;
  OwnedMessage message;
};

// The next messages of one file.
class Side {
 public:
  // The input must outlive the side.
  explicit Side(MessageInput& input) : input_(input) {}

  // As far as the input has so many, and while they are not large. A failure is the end.
  void fill(std::size_t count) {
    constexpr std::size_t enough = std::size_t{1} << 20;
    while (!isAtEnd_ && items_.size() < count && (items_.empty() || size_ < enough)) {
      if (auto read = readNext(); !read) failure_ = read.error();
    }
  }

  const std::deque<Item>& items() const { return items_; }
  bool isAtEnd() const { return isAtEnd_; }
  const std::optional<Failure>& failure() const { return failure_; }
  std::uint64_t offset() const { return input_.frame().offset; }
  void drop(std::size_t count) {
    for (; count > 0; --count) {
      size_ -= items_.front().encoding.size();
      items_.pop_front();
    }
  }

 private:
  Outcome<void> readNext() {
    isAtEnd_ = true;
    const auto hasNext = input_.next();
    if (!hasNext) return std::unexpected(hasNext.error());
    if (!*hasNext) return {};
    auto message = input_.message();
    if (!message) return std::unexpected(message.error());
    items_.push_back({input_.frame().number, std::string(input_.encoding()), std::move(*message)});
    size_ += items_.back().encoding.size();
    isAtEnd_ = false;
    return {};
  }

  MessageInput& input_;
  std::deque<Item> items_;
  std::size_t size_ = 0;  // of the encodings
  bool isAtEnd_ = false;
  std::optional<Failure> failure_;
};

class Comparison {
 public:
  Comparison(const Options& options, OutputFile& output)
      : options_(options), output_(output), palette_(options.colour, options.output ? -1 : STDOUT_FILENO) {}

  bool hasFoundDifferences() const { return hasFoundDifferences_; }
  // Whether nothing that may follow matters.
  bool isDecided() const { return hasFoundDifferences_ && options_.isQuiet; }

  // Tells where two messages differ that belong together.
  Outcome<void> compare(const Item& before, const Item& after) {
    const auto differences = compare::differencesOfLeaves(leavesOf(before), leavesOf(after));
    for (const Difference& difference : differences) {
      const bool isAdded = difference.kind == Difference::Kind::added;
      if (auto told = tell(isAdded ? after : before, difference); !told) return told;
    }
    if (!options_.comparesEncodings || before.encoding == after.encoding) return {};
    const auto mismatch = std::ranges::mismatch(before.encoding, after.encoding);
    const auto at = static_cast<std::uint64_t>(mismatch.in1 - before.encoding.begin());
    return tell(before, {.kind = Difference::Kind::changed,
                         .path = "encoding",
                         .before = std::to_string(before.encoding.size()) + " bytes",
                         .after = std::to_string(after.encoding.size()) +
                                  " bytes, the first that differs is " + bytePlace(at)});
  }

  // A message that only one side has.
  Outcome<void> tellExtra(const Item& extra, Difference::Kind kind) {
    auto leaves = leavesOf(extra);
    leaves.insert(leaves.begin(), {{}, compare::MessagePresence{options_.type->fullName()}});
    const std::string summary = compare::summaryOf(leaves);
    return tell(extra, {kind, {}, summary, summary});
  }

  compare::AlignmentKey keyOf(const Item& item) const { return compare::keyOf(leavesOf(item)); }

 private:
  // Without those that are to be ignored.
  std::vector<compare::Leaf> leavesOf(const Item& item) const {
    auto leaves = item.message->leaves();
    std::erase_if(leaves, [&](const compare::Leaf& leaf) {
      return std::ranges::any_of(options_.ignored, [&](const std::string& path) { return leaf.isAt(path); });
    });
    return leaves;
  }

  Outcome<void> tell(const Item& item, const Difference& difference) {
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
    if (options_.isDelimited) place = "message " + std::to_string(item.number) + ": ";
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

// Aligns the messages that both sides hold, and tells what differs. Where more may follow, what stands behind the last
// pair of equal messages waits for it. Behind a failure nothing is known of the other side's messages.
Outcome<void> compareHeld(Comparison& comparison, Side& left, Side& right) {
  const auto keysOf = [&](const Side& side) {
    std::vector<compare::AlignmentKey> keys;
    for (const Item& item : side.items()) keys.push_back(comparison.keyOf(item));
    return keys;
  };
  const auto before = keysOf(left);
  const auto after = keysOf(right);
  auto pairs = compare::align(before, after);
  const auto isEqual = [&](const compare::AlignedPair& pair) {
    return pair.before && pair.after && before[*pair.before].contents == after[*pair.after].contents;
  };
  const auto last = std::ranges::find_if(pairs.rbegin(), pairs.rend(), isEqual).base();
  if (left.failure() || right.failure()) {
    while (!pairs.empty() && !(left.failure() ? pairs.back().before : pairs.back().after)) pairs.pop_back();
  } else if (!(left.isAtEnd() && right.isAtEnd()) && last != pairs.begin()) {
    pairs.erase(last, pairs.end());
  }
  std::size_t leftCount = 0;
  std::size_t rightCount = 0;
  for (const auto& [old, now] : pairs) {
    leftCount += old ? 1 : 0;
    rightCount += now ? 1 : 0;
    auto told = old && now ? comparison.compare(left.items()[*old], right.items()[*now])
                : old      ? comparison.tellExtra(left.items()[*old], Difference::Kind::removed)
                           : comparison.tellExtra(right.items()[*now], Difference::Kind::added);
    if (!told || comparison.isDecided()) return told;
  }
  left.drop(leftCount);
  right.drop(rightCount);
  return {};
}

Outcome<void> compareFiles(const Options& options, OutputFile& output, Comparison& comparison,
                           Progress& progress) {
  // So many messages are looked through for one that was met again.
  constexpr std::size_t most = 1000;
  const auto before = MessageInput::open(options.files[0], options, output);
  if (!before) return std::unexpected(before.error());
  const auto after = MessageInput::open(options.files[1], options, output);
  if (!after) return std::unexpected(after.error());
  Side left(**before);
  Side right(**after);
  const auto fill = [&](std::size_t count) {
    left.fill(count);
    right.fill(count);
  };
  for (std::uint64_t count = 1; !comparison.isDecided(); ++count) {
    fill(1);
    progress.update(count, left.offset());
    const bool hasBoth = !left.items().empty() && !right.items().empty();
    if (hasBoth && left.items().front().encoding == right.items().front().encoding) {
      left.drop(1);
      right.drop(1);
      continue;
    }
    // Any difference will do where nothing is told, and what follows the other side's end is told as it comes.
    if (hasBoth && !options.isQuiet) fill(most);
    if (auto compared = compareHeld(comparison, left, right); !compared) return compared;
    for (const Side* const side : {&left, &right}) {
      if (side->failure()) return std::unexpected(*side->failure());
    }
    if (left.items().empty() && right.items().empty() && left.isAtEnd() && right.isAtEnd()) return {};
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

// identify.
#include <algorithm>
#include <array>
#include <cstdio>
#include <string>
#include <utility>
#include <vector>

#include "tools/orv/commands.hpp"
#include "tools/orv/file_loop.hpp"
#include "tools/orv/likelihood.hpp"
#include "tools/orv/message_input.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/progress.hpp"

namespace orv::tool {

namespace {

std::string count(std::size_t number, std::string_view thing) {
  return std::to_string(number) + " " + std::string(thing) + (number == 1 ? "" : "s");
}

// The likeliest first; of the types that explain nothing, none.
std::string describe(std::vector<Candidate> candidates) {
  std::erase_if(candidates, [](const Candidate& candidate) { return candidate.score <= 0; });
  if (candidates.empty()) return "no type has any of these fields\n";
  std::size_t nameWidth = 0;
  for (const Candidate& candidate : candidates)
    nameWidth = std::max(nameWidth, candidate.type->fullName.size());
  std::string text;
  for (const Candidate& candidate : candidates) {
    std::array<char, 16> share;
    std::snprintf(share.data(), share.size(), "%3.0f %%  ", 100 * candidate.score);
    text += share.data();
    text += candidate.type->fullName;
    text.append(nameWidth + 2 - candidate.type->fullName.size(), ' ');
    text += count(candidate.knownFields, "field");
    if (candidate.unknownFields != 0) text += ", " + std::to_string(candidate.unknownFields) + " unknown";
    text += '\n';
  }
  return text;
}

Outcome<void> identifyFile(const std::string& path, const Options& options, OutputFile& output,
                           Progress& progress) {
  const auto file = MessageFile::open(path, options);
  if (!file) return std::unexpected(file.error());
  MessageInput& messages = *file->messages;
  for (bool isFirst = true;; isFirst = false) {
    auto hasNext = messages.next();
    if (!hasNext) return std::unexpected(std::move(hasNext.error()));
    if (!*hasNext) return {};
    const auto ranked = rankTypes(std::as_bytes(std::span(messages.encoding())));
    if (!ranked) return std::unexpected(messages.failureOf(ranked.error()));
    std::string text = isFirst ? "" : "\n";
    if (options.files.size() > 1) text += path + ":\n";
    if (options.isDelimited) text += "message " + std::to_string(messages.frame().number) + ":\n";
    if (auto written = output.write(text + describe(*ranked)); !written) return written;
    progress.update(messages.frame().number, messages.frame().offset);
  }
}

}  // namespace

ExitStatus runIdentify(const Options& options) {
  OutputFile output(options.output);
  Progress progress(output.isTerminal());
  return forEachFile(options, output, progress,
                     [&](const std::string& path) { return identifyFile(path, options, output, progress); });
}

}  // namespace orv::tool

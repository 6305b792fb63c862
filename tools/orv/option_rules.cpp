#include "tools/orv/option_rules.hpp"

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <charconv>
#include <limits>

#include "tools/orv/terminal.hpp"

namespace orv::tool {

namespace {

bool readsFiles(Command command) { return command != Command::types && command != Command::schema; }

void fillInFormats(Options& options) {
  if (options.command == Command::decode) {
    if (!options.from) options.from = Format::binary;
    if (!options.to) options.to = Format::text;
  }
  if (options.command == Command::encode && !options.to) options.to = Format::binary;
}

}  // namespace

std::optional<std::size_t> sizeInBytes(std::string_view text) {
  std::size_t number = 0;
  const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (status != std::errc()) return std::nullopt;
  std::string unit(end, text.data() + text.size());
  std::ranges::transform(unit, unit.begin(),
                         [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  constexpr std::string_view letters = "kmg";
  const auto power = unit.empty() ? std::string_view::npos : letters.find(unit[0]);
  const std::string_view rest = std::string_view(unit).substr(power == std::string_view::npos ? 0 : 1);
  if (!rest.empty() && rest != "b" && (rest != "ib" || power == std::string_view::npos)) return std::nullopt;
  const std::size_t shift = power == std::string_view::npos ? 0 : 10 * (power + 1);
  if (number > std::numeric_limits<std::size_t>::max() >> shift) return std::nullopt;
  return number << shift;
}

std::optional<std::string> completeOptions(Options& options) {
  fillInFormats(options);
  if (options.command == Command::convert && (!options.from || !options.to))
    return "--from and --to must be given";
  if (!readsFiles(options.command)) return std::nullopt;
  if (options.command == Command::diff) {
    if (options.files.size() != 2) return "takes two files, not " + std::to_string(options.files.size());
    if (options.files[0] == "-" && options.files[1] == "-")
      return "only one of the files can be standard input";
  }
  if (options.files.empty()) {
    const bool mayBeTyped =
        options.command == Command::encode || options.from.value_or(Format::binary) != Format::binary;
    if (!mayBeTyped && isTerminal(STDIN_FILENO)) {
      return "nothing to read: name a file or pipe one in (orv --help tells more)";
    }
    options.files.emplace_back("-");
  }
  if (options.to == Format::binary && !options.isDelimited && options.files.size() > 1) {
    return "several messages in binary need --delimited";
  }
  if (options.to == Format::binary && !options.output && isTerminal(STDOUT_FILENO)) {
    return "binary output is not for a terminal: use --to hex, or -o FILE";
  }
  return std::nullopt;
}

}  // namespace orv::tool

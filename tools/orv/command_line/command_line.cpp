#include "tools/orv/command_line/command_line.hpp"

#include <unistd.h>

#include <algorithm>
#include <expected>
#include <optional>
#include <span>
#include <vector>

#include <orv/spelling/nearest_name.hpp>
#include "tools/orv/output/palette.hpp"

namespace orv::tool {

namespace {

using Words = std::span<const char* const>;
using Result = std::expected<void, Failure>;

std::unexpected<Failure> usageFailure(const std::string& reason) {
  return fail(ExitStatus::usage, "orv: " + reason);
}

// Takes the words behind a command apart. Options may stand before and behind files, letters together ("-dq"),
// values in a word of their own or not ("-tMember", "--type=Member"); what follows "--" is no option.
class Parser {
 public:
  Parser(const Command& command, Words words) : command_(command), words_(words) {}

  Result parse() {
    while (!words_.empty()) {
      const std::string_view word = takeWord();
      const bool isFile = isBehindOptions_ || word == "-" || !word.starts_with('-');
      if (!isFile && word == "--") {
        isBehindOptions_ = true;
      } else if (auto taken = isFile ? takeFile(word) : takeOptions(word); !taken) {
        return taken;
      }
    }
    return {};
  }

  bool wantsHelp() const { return wantsHelp_; }
  Options& options() { return options_; }

 private:
  std::string_view takeWord() {
    const std::string_view word = words_.front();
    words_ = words_.subspan(1);
    return word;
  }

  Result takeFile(std::string_view word) {
    if (command_.operands == Operands::none) return unexpected("unexpected ", word);
    options_.files.emplace_back(word);
    return {};
  }

  Result takeOptions(std::string_view word) {
    if (word.starts_with("--")) {
      const auto equals = word.find('=');
      const auto* const option = find(&OptionDescription::name, word.substr(0, equals));
      if (option == nullptr) return unexpected("unknown option ", word.substr(0, equals));
      if (equals == std::string_view::npos) return takeOption(*option, std::nullopt);
      return takeOption(*option, word.substr(equals + 1));
    }
    for (std::size_t at = 1; at < word.size(); ++at) {
      const auto* const option = find(&OptionDescription::letter, word[at]);
      if (option == nullptr) return unexpected("unknown option ", word);
      const bool isFlag = option->valueName.empty();
      const bool isLast = isFlag || at + 1 == word.size();
      const auto value = isLast ? std::nullopt : std::optional(word.substr(at + 1));
      if (auto taken = takeOption(*option, value); !taken || !isFlag) return taken;
    }
    return {};
  }

  template <class Key>
  const OptionDescription* find(Key OptionDescription::*key, Key value) const {
    const auto found =
        std::ranges::find(command_.options, value, [&](const auto* option) { return option->*key; });
    return found != command_.options.end() ? *found : nullptr;
  }

  // With the value that stands in the option's own word, if any.
  Result takeOption(const OptionDescription& option, std::optional<std::string_view> value) {
    const std::string name(option.name);
    if (option.valueName.empty()) {
      if (value) return usageFailure(name + ": takes no value");
      value.emplace();
    }
    if (!value && words_.empty())
      return usageFailure(name + ": " + std::string(option.valueName) + " is missing");
    if (!value) value = takeWord();
    if (option.take == nullptr) {
      wantsHelp_ = true;
    } else if (const auto taken = option.take(options_, command_, *value); !taken) {
      return usageFailure(name + ": " + taken.error());
    }
    return {};
  }

  Result unexpected(std::string_view what, std::string_view word) const {
    std::vector<std::string_view> known;
    for (const auto* const option : command_.options) known.push_back(option->name);
    return usageFailure(std::string(command_.name) + ": " + std::string(what) + std::string(word) +
                        spelling::suggestion(word, known));
  }

  const Command& command_;
  Words words_;
  Options options_;
  bool isBehindOptions_ = false;
  bool wantsHelp_ = false;
};

// Fills in what the command has for options that are not given. The answer says what is wrong with the options
// together, if anything is.
std::optional<std::string> complete(const Command& command, Options& options) {
  if (!options.from) options.from = command.from.byDefault;
  if (!options.to) options.to = command.to.byDefault;
  const auto isMissing = [](const FormatChoice& choice, std::optional<Format> given) {
    return !choice.allowed.empty() && !choice.isGuessed && !given;
  };
  if (isMissing(command.from, options.from) || isMissing(command.to, options.to))
    return "--from and --to must be given";
  auto& files = options.files;
  if (command.operands == Operands::twoFiles) {
    if (files.size() != 2) return "takes two files, not " + std::to_string(files.size());
    if (files[0] == "-" && files[1] == "-") return "only one of the files can be standard input";
  }
  if (command.operands == Operands::files && files.empty()) {
    // Other formats may be typed.
    if (options.from == Format::binary && isTerminal(STDIN_FILENO))
      return "nothing to read: name a file or pipe one in (orv --help tells more)";
    files.emplace_back("-");
  }
  if (options.to != Format::binary) return std::nullopt;
  if (!options.isDelimited && files.size() > 1) return "several messages in binary need --delimited";
  if (!options.output && isTerminal(STDOUT_FILENO))
    return "binary output is not for a terminal: use --to hex, or -o FILE";
  return std::nullopt;
}

std::variant<Request, Answer, Failure> parseCommand(const Command& command, Words words) {
  Parser parser(command, words);
  if (const auto parsed = parser.parse(); !parsed) return parsed.error();
  if (parser.wantsHelp()) return Answer{helpText(command, terminalWidth(STDOUT_FILENO))};
  if (const auto reason = complete(command, parser.options()))
    return usageFailure(std::string(command.name) + ": " + *reason).error();
  return Request{&command, parser.options()};
}

}  // namespace

std::variant<Request, Answer, Failure> parseCommandLine(int argumentCount, const char* const* arguments) {
  const Words words(arguments + std::min(1, argumentCount), arguments + argumentCount);
  const std::string_view first = words.empty() ? "" : words.front();
  if (first == "-h" || first == "--help") return Answer{helpText(terminalWidth(STDOUT_FILENO))};
  if (first == "--version") return Answer{"orv " ORV_VERSION "\n"};
  // Both are for the build.
  if (first == "--man-page" && words.size() == 2) return Answer{manPage(words[1])};
  if (first == "--bash-completion") return Answer{bashCompletion()};

  const auto commands = commandTable.commands;
  const auto named = std::ranges::find(commands, first, &Command::name);
  if (named != commands.end()) return parseCommand(*named, words.subspan(1));
  const bool couldBeFile = first.empty() || first.starts_with('-') || ::access(words.front(), F_OK) == 0;
  if (!couldBeFile) {
    std::vector<std::string_view> names;
    for (const Command& command : commands) names.push_back(command.name);
    if (const std::string suggestion = spelling::suggestion(first, names); !suggestion.empty())
      return usageFailure("no file and no command \"" + std::string(first) + "\"" + suggestion).error();
  }
  return parseCommand(commands.front(), words);
}

}  // namespace orv::tool

#include "tools/orv/command_line/command.hpp"

#include <getopt.h>
#include <unistd.h>

#include <algorithm>
#include <expected>
#include <optional>
#include <span>
#include <vector>

#include <orv/spelling/nearest_name.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/output/palette.hpp"

namespace orv::tool {

namespace {

std::unexpected<Failure> usageFailure(const std::string& reason) {
  return fail(ExitStatus::usage, "orv: " + reason);
}

std::unexpected<Failure> failUnexpected(const Command& command, std::string_view what,
                                        std::string_view word) {
  return usageFailure(std::string(command.name) + ": " + std::string(what) + " " + std::string(word) +
                      spelling::suggestion(word, command.options, &OptionDescription::name));
}

// What getopt_long answers for an option: its letter, or a number above all letters.
int codeOf(const Command& command, const OptionDescription& option) {
  if (option.letter != '\0') return option.letter;
  return 0x100 + static_cast<int>(std::ranges::find(command.options, &option) - command.options.begin());
}

// The word that getopt_long does not know, without a value.
std::string unknownOption(std::span<char*> words) {
  if (::optopt != 0) return {'-', static_cast<char>(::optopt)};
  const std::string_view word = words[static_cast<std::size_t>(::optind) - 1];
  return std::string(word.substr(0, word.find('=')));
}

// A command's options as getopt_long takes them.
struct KnownOptions {
  std::string letters = ":";  // so that a value that is missing is told from an option that is unknown
  std::vector<::option> names;
};

KnownOptions optionsOf(const Command& command) {
  KnownOptions known;
  auto& [letters, names] = known;
  for (const auto* const option : command.options) {
    const int needsValue = option->valueName.empty() ? no_argument : required_argument;
    // The name is a literal, which ends with a zero.
    names.push_back({option->name.data() + 2, needsValue, nullptr, codeOf(command, *option)});
    if (option->letter == '\0') continue;
    letters += option->letter;
    if (needsValue != 0) letters += ':';
  }
  names.push_back({});
  return known;
}

// Enters the words behind a command into the options. Answers whether help is asked for.
std::expected<bool, Failure> readWords(const Command& command, std::span<char*> words, Options& options) {
  const KnownOptions known = optionsOf(command);
  const int count = static_cast<int>(words.size());
  const auto next = [&] {
    return ::getopt_long(count, words.data(), known.letters.c_str(), known.names.data(), nullptr);
  };
  bool wantsHelp = false;
  ::opterr = 0;  // what is wrong is said here
  for (int code = next(); code != -1; code = next()) {
    const int given = code == '?' || code == ':' ? ::optopt : code;
    const auto found = std::ranges::find(command.options, given,
                                         [&](const auto* option) { return codeOf(command, *option); });
    if (found == command.options.end())
      return failUnexpected(command, "unknown option", unknownOption(words));
    const OptionDescription& option = **found;
    const std::string name(option.name);
    if (code == '?') return usageFailure(name + ": takes no value");
    if (code == ':') return usageFailure(name + ": " + std::string(option.valueName) + " is missing");
    wantsHelp = wantsHelp || option.take == nullptr;
    if (option.take == nullptr) continue;
    const auto taken = option.take(options, command, option.valueName.empty() ? "" : ::optarg);
    if (!taken) return usageFailure(name + ": " + taken.error());
  }
  for (const char* const word : words.subspan(std::min(words.size(), static_cast<std::size_t>(::optind)))) {
    if (command.operands == Operands::none) return failUnexpected(command, "unexpected", word);
    options.files.emplace_back(word);
  }
  return wantsHelp;
}

// Says which of the options changes nothing, if one does.
std::optional<std::string> withoutEffect(const Options& options) {
  const PayloadPairing& payloads = options.payloads;
  if (options.keepsGoing && !options.isDelimited) return "--keep-going is for streams, with --delimited";
  if (options.selection.hasNumbers() && !options.isDelimited) return "-n is for streams, with --delimited";
  const auto noField = [](std::string_view option, std::string_view path, const MessageType& type) {
    return std::string(option) + ": " + spelling::quotedText(path) + " is no field of " +
           std::string(type.fullName());
  };
  if (const auto* const condition = options.selection.unmeetable(*options.type))
    return noField("--only", *condition, *options.type);
  for (const auto& [path, type] : options.innerTypes) {
    const MessageType* outer = options.type;
    std::string_view rest = path;
    for (const auto& [outerPath, outerType] : options.innerTypes) {
      if (!path.starts_with(outerPath + '.')) continue;
      outer = outerType;
      rest = std::string_view(path).substr(outerPath.size() + 1);
    }
    if (!leadsToField(rest, *outer->descriptor)) return noField("--as", rest, *outer);
  }
  for (const std::string& path : options.ignored) {
    if (!leadsToField(path, *options.type->descriptor)) return noField("--ignore", path, *options.type);
  }
  if (options.showsUnknownFields && options.to != Format::json) return "--unknown is for --to json";
  if (options.hidesSecrets && isBytes(*options.to)) return "--redact is for text and JSON: bytes stay bytes";
  if (!payloads.isClosed() && !payloads.hasOverrides()) return std::nullopt;
  if (payloads.isClosed() && payloads.hasOverrides())
    return "--no-unwrap leaves nothing for --payload to open";
  const std::string given = payloads.isClosed() ? "--no-unwrap" : "--payload";
  if (!options.type->isEnvelope())
    return given + " is for envelopes: " + std::string(options.type->fullName()) + " has no payload";
  if (options.from && isBytes(*options.from) && options.to && isBytes(*options.to))
    return given + " changes nothing where bytes stay bytes";
  return std::nullopt;
}

// Fills in what the command has for options that are not given. The answer says what is wrong with the options
// together, if anything is.
std::optional<std::string> complete(const Command& command, Options& options) {
  if (!options.from) options.from = command.from.byDefault;
  options.possibleFormats = command.from.allowed;
  if (!options.to) options.to = command.to.byDefault;
  if (const auto reason = withoutEffect(options)) return reason;
  auto& files = options.files;
  if (command.operands == Operands::twoFiles) {
    if (files.size() != 2) return "takes two files, not " + std::to_string(files.size());
    if (files[0] == "-" && files[1] == "-") return "only one of the files can be standard input";
  }
  if (command.operands == Operands::command && files.size() > 1)
    return "takes one command, not " + std::to_string(files.size());
  if (command.operands == Operands::files && files.empty()) {
    // Other formats may be typed.
    if (options.from.value_or(command.from.allowed.front()) == Format::binary && isTerminal(STDIN_FILENO))
      return "nothing to read: name a file or pipe one in (orv --help tells more)";
    files.emplace_back("-");
  }
  if (options.to != Format::binary) return std::nullopt;
  if (!options.isDelimited && files.size() > 1) return "several messages in binary need --delimited";
  if (!options.output && isTerminal(STDOUT_FILENO))
    return "binary output is not for a terminal: use --to hex, or -o FILE";
  return std::nullopt;
}

std::variant<Request, Answer, Failure> parseCommand(const Command& command, std::span<char*> words) {
  Options options;
  const auto wantsHelp = readWords(command, words, options);
  if (!wantsHelp) return wantsHelp.error();
  if (*wantsHelp) return Answer{helpText(command, terminalWidth(STDOUT_FILENO))};
  if (const auto reason = complete(command, options))
    return usageFailure(std::string(command.name) + ": " + *reason).error();
  return Request{&command, options};
}

}  // namespace

std::variant<Request, Answer, Failure> parseCommandLine(std::span<char*> words) {
  const std::string_view first = words.size() < 2 ? "" : words[1];
  if (first == "-h" || first == "--help") return Answer{helpText(terminalWidth(STDOUT_FILENO))};
  if (first == "-V" || first == "--version") return Answer{"orv " ORV_VERSION "\n"};
  // Both are for the build.
  if (first == "--man-page" && words.size() == 3) return Answer{manPage(words[2])};
  if (first == "--bash-completion") return Answer{bashCompletion()};

  if (const Command* const named = findCommand(first)) return parseCommand(*named, words.subspan(1));
  const auto commands = commandTable.commands;
  const bool couldBeFile = first.empty() || first.starts_with('-') || ::access(words[1], F_OK) == 0;
  if (!couldBeFile) {
    if (const auto suggestion = spelling::suggestion(first, commands, &Command::name); !suggestion.empty())
      return usageFailure("no file and no command " + spelling::quotedText(first) + suggestion).error();
  }
  auto parsed = parseCommand(commands.front(), words);
  // A command that stands behind options was taken for a file, unless there is one of this name.
  const auto isMisplaced = [](const std::string& word) {
    return findCommand(word) != nullptr && ::access(word.c_str(), F_OK) != 0;
  };
  std::vector<std::string> operands;
  if (const auto* const request = std::get_if<Request>(&parsed)) operands = request->options.files;
  if (std::holds_alternative<Failure>(parsed)) operands.assign(words.begin(), words.end());
  const auto misplaced = std::ranges::find_if(operands, isMisplaced);
  if (misplaced == operands.end()) return parsed;
  return usageFailure("the command comes first: orv " + *misplaced + " ...").error();
}

}  // namespace orv::tool

// The only source that knows the library which takes command lines apart.
#include "tools/orv/options.hpp"

#include <unistd.h>
#include <CLI/CLI.hpp>

#include <algorithm>
#include <array>
#include <functional>
#include <memory>
#include <string_view>

#include <orv/json/nearest_name.hpp>
#include "tools/orv/command_line.hpp"
#include "tools/orv/command_texts.hpp"
#include "tools/orv/help.hpp"
#include "tools/orv/man_page.hpp"
#include "tools/orv/option_rules.hpp"

namespace orv::tool {

namespace {

// Thrown out of an option's callback; the library passes it on.
[[noreturn]] void refuse(const std::string& option, const std::string& reason) {
  throw CLI::ValidationError(option, reason);
}

// Sets up one command for the library and for the help at once.
class CommandSetup {
 public:
  CommandSetup(CLI::App& app, CommandDescription& description) : app_(app), description_(description) {
    app_.set_help_flag();
    flag("-h,--help", "show this help", wantsHelp_);
  }

  bool wantsHelp() const { return wantsHelp_; }

  void flag(const std::string& names, const std::string& text, bool& value) {
    describe(names, "", text);
    app_.add_flag(names, value);
  }

  void option(const std::string& names, const std::string& valueName, const std::string& text,
              const std::function<void(const std::string&)>& take) {
    describe(names, valueName, text);
    app_.add_option_function<std::string>(names, take)->trigger_on_parse();
  }

  void operands(std::vector<std::string>& values) {
    constexpr int any = 1 << 20;
    app_.add_option("operands", values)->expected(0, any);
  }

 private:
  // Help comes last.
  void describe(const std::string& names, const std::string& valueName, const std::string& text) {
    auto& options = description_.options;
    const auto place = options.empty() ? options.end() : options.end() - 1;
    options.insert(place, {names, valueName, text});
  }

  CLI::App& app_;
  CommandDescription& description_;
  bool wantsHelp_ = false;
};

// "binary (default), hex, base64"
std::string listed(const std::vector<Format>& formats, std::optional<Format> byDefault) {
  std::string names;
  for (const Format format : formats) {
    if (!names.empty()) names += ", ";
    names += formatNames[static_cast<std::size_t>(format)];
    if (format == byDefault) names += " (default)";
  }
  return names;
}

void addFormat(CommandSetup& setup, const std::string& name, const std::string& text,
               std::optional<Format>& value, std::vector<Format> allowed, std::optional<Format> byDefault) {
  const std::string what = text + ": " + listed(allowed, byDefault);
  setup.option(name, "FORMAT", what, [&value, name, allowed = std::move(allowed)](const std::string& given) {
    const auto* const found = std::ranges::find(formatNames, given);
    const auto format = static_cast<Format>(found - formatNames.begin());
    if (std::ranges::find(allowed, format) == allowed.end()) {
      refuse(name, "\"" + given + "\" is none of " + listed(allowed, std::nullopt));
    }
    value = format;
  });
}

void addType(CommandSetup& setup, Options& options) {
  setup.option("-t,--type", "TYPE",
               "the message type, for instance Group.MemberAdded (default SessionMessage)",
               [&options](const std::string& name) {
                 const auto type = findMessageType(name);
                 if (!type) refuse("--type", type.error());
                 options.type = *type;
               });
}

void addPayload(CommandSetup& setup, Options& options) {
  setup.option("--payload", "[KIND=]TYPE",
               "the type of an envelope's payload, of all or of those of one kind",
               [&options](const std::string& pairing) {
                 if (auto taken = options.payloads.override(pairing); !taken)
                   refuse("--payload", taken.error());
               });
}

void addColour(CommandSetup& setup, Options& options) {
  setup.option("--color", "WHEN", "auto (default), always, never", [&options](const std::string& when) {
    constexpr std::array<std::string_view, 3> names{"auto", "always", "never"};
    const auto* const found = std::ranges::find(names, when);
    if (found == names.end()) refuse("--color", "\"" + when + "\" is none of auto, always, never");
    options.colour = static_cast<ColourChoice>(found - names.begin());
  });
}

void addMaximumSize(CommandSetup& setup, Options& options) {
  setup.option("--max-size", "SIZE", "the most bytes that a message may have (default 16MiB)",
               [&options](const std::string& given) {
                 const auto size = sizeInBytes(given);
                 if (!size) refuse("--max-size", "\"" + given + "\" is no size (1000000, 64KiB, 1G)");
                 options.maximumSize = *size;
               });
}

const std::vector<Format> allFormats{Format::binary, Format::hex, Format::base64, Format::text, Format::json};
const std::vector<Format> byteFormats{Format::binary, Format::hex, Format::base64};
const std::vector<Format> readableFormats{Format::text, Format::json};

// What the commands share, each where it means something.
void addOptions(CommandSetup& setup, Command command, Options& options, bool& leavesClosed) {
  const bool readsMessages = command != Command::types && command != Command::schema;
  const bool showsMessages = command != Command::encode && command != Command::identify && readsMessages;
  if (readsMessages && command != Command::identify) {
    addType(setup, options);
    addPayload(setup, options);
  }
  if (showsMessages) setup.flag("--no-unwrap", "leave the payloads of envelopes bytes", leavesClosed);
  switch (command) {
    case Command::decode:
      addFormat(setup, "--from", "the input's format", options.from, byteFormats, Format::binary);
      addFormat(setup, "--to", "the output's format", options.to, readableFormats, Format::text);
      break;
    case Command::encode:
      addFormat(setup, "--from", "the input's format, if not as it begins", options.from, readableFormats,
                {});
      addFormat(setup, "--to", "the output's format", options.to, byteFormats, Format::binary);
      break;
    case Command::convert:
      addFormat(setup, "--from", "the input's format", options.from, allFormats, {});
      addFormat(setup, "--to", "the output's format", options.to, allFormats, {});
      break;
    case Command::inspect:
    case Command::diff:
      addFormat(setup, "--from", "the input's format", options.from, allFormats, Format::binary);
      break;
    case Command::identify:
      addFormat(setup, "--from", "the input's format", options.from, byteFormats, Format::binary);
      break;
    case Command::types:
    case Command::schema: break;
  }
  if (readsMessages) setup.flag("-d,--delimited", "read and write streams of messages", options.isDelimited);
  if (command == Command::decode || command == Command::convert) {
    setup.flag("--unknown", "show unknown fields in JSON", options.showsUnknownFields);
  }
  if (command == Command::diff) {
    setup.flag("--bytes", "compare the encodings too", options.comparesEncodings);
    setup.flag("-q,--quiet", "say nothing, the exit status tells", options.isQuiet);
  }
  if (command == Command::diff || command == Command::inspect) addColour(setup, options);
  if (readsMessages) {
    addMaximumSize(setup, options);
  }
  setup.option("-o,--output", "FILE", "write to the file (default standard output)",
               [&options](const std::string& path) { options.output = path; });
  if (command != Command::schema) setup.operands(options.files);
}

// All of the command line: the library's objects and the description, filled together.
class CommandLine {
 public:
  CommandLine() : app_("", "orv") {
    app_.set_help_flag();
    app_.add_flag("-h,--help", wantsHelp_);
    app_.add_flag("--version", wantsVersion_);
    app_.add_option("--man-page", manPageDate_);
    app_.require_subcommand(0, 1);
    for (std::size_t index = 0; index < description_.commands.size(); ++index) {
      CommandDescription& command = description_.commands[index];
      CLI::App* const sub = app_.add_subcommand(command.name);
      sub->allow_extras();
      setups_.push_back(std::make_unique<CommandSetup>(*sub, command));
      addOptions(*setups_.back(), static_cast<Command>(index), options_, leavesClosed_);
    }
  }

  std::variant<Options, Answer, Failure> parse(std::vector<std::string> arguments);

 private:
  static std::string unexpectedWord(const CommandDescription& command, const std::string& word);

  CommandLineDescription description_ = describeCommandLine();
  CLI::App app_;
  std::vector<std::unique_ptr<CommandSetup>> setups_;
  Options options_;
  bool leavesClosed_ = false;
  bool wantsHelp_ = false;
  bool wantsVersion_ = false;
  std::string manPageDate_;
};

Failure usageFailure(const std::string& reason) { return {ExitStatus::usage, "orv: " + reason}; }

std::variant<Options, Answer, Failure> CommandLine::parse(std::vector<std::string> arguments) {
  // The library takes them last first.
  std::ranges::reverse(arguments);
  try {
    app_.parse(std::move(arguments));
  } catch (const CLI::ParseError& error) {
    std::string reason = error.what();
    reason = reason.substr(0, reason.find('\n'));
    return usageFailure(reason);
  }
  const std::size_t width = terminalWidth(STDOUT_FILENO);
  if (wantsVersion_) return Answer{"orv " ORV_VERSION "\n"};
  if (!manPageDate_.empty()) return Answer{manPage(description_, manPageDate_)};
  const auto chosen = app_.get_subcommands();
  if (wantsHelp_ || chosen.empty()) return Answer{helpText(description_, width)};
  for (std::size_t index = 0; index < setups_.size(); ++index) {
    if (description_.commands[index].name != chosen.front()->get_name()) continue;
    if (setups_[index]->wantsHelp()) return Answer{helpText(description_.commands[index], width)};
    options_.command = static_cast<Command>(index);
  }
  const CommandDescription& command = description_.commands[static_cast<std::size_t>(options_.command)];
  const auto extras = chosen.front()->remaining();
  if (!extras.empty()) return usageFailure(unexpectedWord(command, extras.front()));
  if (leavesClosed_) options_.payloads.leaveClosed();
  if (const auto reason = completeOptions(options_)) return usageFailure(command.name + ": " + *reason);
  return options_;
}

std::string CommandLine::unexpectedWord(const CommandDescription& command, const std::string& word) {
  std::vector<std::string_view> known;
  for (const OptionDescription& option : command.options) {
    const std::string_view names = option.names;
    known.push_back(names.substr(names.find("--")));
  }
  const std::string given = word.substr(0, word.find('='));
  const std::string what = given.starts_with('-') ? "unknown option " : "unexpected ";
  return command.name + ": " + what + given + json::suggestion(given, known);
}

}  // namespace

std::variant<Options, Answer, Failure> parseCommandLine(int argumentCount, const char* const* arguments) {
  std::vector<std::string> words(arguments + 1, arguments + std::max(1, argumentCount));
  CommandLine line;
  const std::vector<std::string_view> names = commandNames();
  const std::string first = words.empty() ? "" : words.front();
  const bool isComplete = std::ranges::find(names, first) != names.end() || first == "--help" ||
                          first == "-h" || first == "--version" || first.starts_with("--man-page");
  if (!isComplete) {
    const bool couldBeFile = first.empty() || first.starts_with('-') || ::access(first.c_str(), F_OK) == 0;
    const std::string suggestion = couldBeFile ? "" : json::suggestion(first, names);
    if (!suggestion.empty()) return usageFailure("no file and no command \"" + first + "\"" + suggestion);
    words.insert(words.begin(), "decode");
  }
  return line.parse(std::move(words));
}

}  // namespace orv::tool

// The subcommands and their options, in one table, and what is made of it: parsing, help, manual page and
// completion.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "tools/orv/failure.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// The formats that a command takes on one side.
struct FormatChoice {
  std::span<const Format> allowed{};
  std::optional<Format> byDefault{};
  bool isGuessed = false;  // where it is not said
};

struct Command;

struct OptionDescription {
  char letter;                 // '\0' for none
  std::string_view name;       // "--type"
  std::string_view valueName;  // "TYPE"; empty for a flag
  std::string_view text;       // a sentence without its full stop; formats are added to it
  // Enters the option, with the value unless it is a flag. The error says what is wrong with the value.
  std::expected<void, std::string> (*take)(Options&, const Command&, std::string_view value);
  // For options that name a format: the ones to choose from.
  FormatChoice Command::*formats = nullptr;
  // The words that the value can be, if they are few.
  std::string_view words = {};
};

struct Example {
  std::string_view line;
  std::string_view text;
};

// What stands behind the options.
enum class Operands : std::uint8_t { none, files, twoFiles, types, command };

// As usage lines have them.
constexpr std::string_view textOf(Operands operands) {
  constexpr std::array<std::string_view, 5> texts{"", " [FILE]...", " A B", " [TYPE]...", " [COMMAND]"};
  return texts[static_cast<std::size_t>(operands)];
}

struct Command {
  std::string_view name;
  // Reports what fails and answers the status to exit with.
  ExitStatus (*run)(const Options&);
  std::string_view summary;  // a few words
  std::string_view text;     // sentences
  Operands operands;
  FormatChoice from{};
  FormatChoice to{};
  std::span<const OptionDescription* const> options{};
  std::array<Example, 3> examples{};  // fewer leave the last ones empty
};

struct StatusDescription {
  ExitStatus status;
  std::string_view meaning;
};

struct CommandTable {
  std::string_view summary;
  std::string_view text;                              // sentences
  std::string_view formats;                           // sentences about them
  std::span<const OptionDescription* const> options;  // outside of the commands
  std::span<const Command> commands;                  // the first is the one that is run if none is named
  std::span<const StatusDescription> statuses;
};

extern const CommandTable commandTable;

// decode, encode and convert.
ExitStatus runConvert(const Options& options);
ExitStatus runInspect(const Options& options);
ExitStatus runDiff(const Options& options);
ExitStatus runIdentify(const Options& options);
ExitStatus runTypes(const Options& options);
ExitStatus runSchema(const Options& options);
ExitStatus runHelp(const Options& options);

const Command* findCommand(std::string_view name);

// "binary (default), hex, base64"
std::string listed(const FormatChoice& formats);

// The option's text with the formats that the command takes.
std::string textOf(const OptionDescription& option, const Command& command);

// Work: a command and its options, which are complete.
struct Request {
  const Command* command;
  Options options;
};

// Text that was asked for in place of work: help, the version, the manual page, the completion.
struct Answer {
  std::string text;
};

// The first word is the program's name. Words change their places.
std::variant<Request, Answer, Failure> parseCommandLine(std::span<char*> words);

// The text of --help, set for a terminal of so many columns; 0 stands for 80.
std::string helpText(std::size_t width);
std::string helpText(const Command& command, std::size_t width);

// The manual page in mdoc(7). The date is that of its contents: "November 22, 2025".
std::string manPage(std::string_view date);

// A script that completes the command in bash.
std::string bashCompletion();

}  // namespace orv::tool

#include "tools/orv/command_line/command.hpp"

#include <algorithm>
#include <cstddef>

namespace orv::tool {

namespace {

std::string escaped(std::string_view text) {
  std::string output;
  for (const char c : text) output += c == '\\' ? "\\e" : std::string(1, c);
  return output;
}

// Sentences as mdoc takes them: each begins a line, and lines are short.
std::string prose(std::string_view text) {
  constexpr std::size_t longestLine = 76;
  std::string output;
  std::size_t column = 0;
  while (!text.empty()) {
    const std::string_view word = text.substr(0, text.find(' '));
    text.remove_prefix(std::min(text.size(), word.size() + 1));
    if (column != 0) output += column + 1 + word.size() > longestLine || output.ends_with('.') ? '\n' : ' ';
    column = output.empty() || output.ends_with('\n') ? word.size() : column + 1 + word.size();
    output += escaped(word);
  }
  if (!output.empty() && output[0] >= 'a' && output[0] <= 'z')
    output[0] = static_cast<char>(output[0] - 'a' + 'A');
  return output + '\n';
}

// "Fl t , Fl -type Ar TYPE"
std::string flags(const OptionDescription& option) {
  std::string output = option.letter == '\0' ? "Fl " : std::string("Fl ") + option.letter + " , Fl ";
  output += option.name.substr(1);
  return option.valueName.empty() ? output : output + " Ar " + std::string(option.valueName);
}

std::string optionList(std::span<const OptionDescription* const> options, const Command& command) {
  std::string output = ".Bl -tag -width Ds\n";
  for (const auto* const option : options)
    output += ".It " + flags(*option) + '\n' + prose(textOf(*option, command) + ".");
  return output + ".El\n";
}

// " [FILE]..." as ".Op Ar FILE ..."
std::string operandsOf(const Command& command) {
  const std::string_view text = textOf(command.operands);
  const auto end = text.find(']');
  if (text.empty()) return {};
  if (end == std::string_view::npos) return ".Ar" + std::string(text) + '\n';
  return ".Op Ar " + std::string(text.substr(2, end - 2)) + (text.ends_with("...") ? " ...\n" : "\n");
}

std::string synopsis() {
  std::string output;
  for (const Command& command : commandTable.commands) {
    const bool isDefault = &command == &commandTable.commands.front();
    output += isDefault ? ".Nm\n.Op Cm " : ".Nm\n.Cm ";
    output += std::string(command.name) + "\n.Op Ar option ...\n";
    output += operandsOf(command);
  }
  return output;
}

std::string exampleList() {
  std::string output = ".Bl -tag -width Ds\n";
  for (const Command& command : commandTable.commands) {
    for (const Example& example : command.examples) {
      if (example.line.empty()) break;
      std::string quoted;
      for (const char c : example.line) quoted += c == '"' ? "\\(dq" : escaped({&c, 1});
      output += ".It Li \"" + quoted + "\"\n" + prose(std::string(example.text) + ".");
    }
  }
  return output + ".El\n";
}

}  // namespace

std::string manPage(std::string_view date) {
  const CommandTable& table = commandTable;
  std::string output = ".Dd " + std::string(date) + "\n.Dt ORV 1\n.Os\n.Sh NAME\n.Nm orv\n.Nd ";
  output += std::string(table.summary) + "\n.Sh SYNOPSIS\n" + synopsis();
  output += ".Sh DESCRIPTION\n" + prose(table.text) + ".Pp\n" + prose(table.formats);
  output += ".Pp\nThe options outside of the commands are:\n";
  output += optionList(table.options, table.commands.front());
  for (const Command& command : table.commands) {
    output += ".Ss orv " + std::string(command.name) + '\n' + prose(command.text);
    output += optionList(command.options, command);
  }
  output += ".Sh ENVIRONMENT\n.Bl -tag -width Ds\n.It Ev NO_COLOR\n";
  output += prose("if it is not empty, nothing is coloured unless --color always asks for it.") + ".El\n";
  output += ".Sh EXIT STATUS\n.Bl -tag -width Ds\n";
  for (const StatusDescription& status : table.statuses) {
    output += ".It " + std::to_string(static_cast<int>(status.status)) + '\n';
    output += prose(std::string(status.meaning) + '.');
  }
  return output + ".El\n.Sh EXAMPLES\n" + exampleList();
}

}  // namespace orv::tool

#include "tools/orv/man_page.hpp"

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

// "-t,--type" as "Fl t , Fl -type".
std::string flags(const OptionDescription& option) {
  std::string output;
  std::string_view names = option.names;
  while (!names.empty()) {
    const std::string_view name = names.substr(0, names.find(','));
    names.remove_prefix(std::min(names.size(), name.size() + 1));
    output += (output.empty() ? "Fl " : " , Fl ") + std::string(name.substr(1));
  }
  return option.valueName.empty() ? output : output + " Ar " + option.valueName;
}

std::string optionList(const std::vector<OptionDescription>& options) {
  std::string output = ".Bl -tag -width Ds\n";
  for (const OptionDescription& option : options)
    output += ".It " + flags(option) + '\n' + prose(option.text + ".");
  return output + ".El\n";
}

std::string commandSection(const CommandDescription& command) {
  std::string output = ".Ss orv " + command.name + '\n';
  output += prose(command.text);
  return output + optionList(command.options);
}

std::string synopsis(const CommandLineDescription& line) {
  std::string output;
  for (const CommandDescription& command : line.commands) {
    output += ".Nm\n";
    output += command.name == line.commands.front().name ? ".Op Cm " : ".Cm ";
    output += command.name + "\n.Op Ar option ...\n";
    if (command.operands == "[FILE]...") output += ".Op Ar\n";
    if (command.operands == "[TYPE]...") output += ".Op Ar type ...\n";
    if (command.operands == "A B") output += ".Ar A B\n";
  }
  return output;
}

std::string exampleList(const CommandLineDescription& line) {
  std::string output = ".Bl -tag -width Ds\n";
  for (const CommandDescription& command : line.commands) {
    for (const ExampleDescription& example : command.examples) {
      std::string quoted;
      for (const char c : example.line) quoted += c == '"' ? "\\(dq" : escaped({&c, 1});
      output += ".It Li \"" + quoted + "\"\n" + prose(example.text + ".");
    }
  }
  return output + ".El\n";
}

}  // namespace

std::string manPage(const CommandLineDescription& line, std::string_view date) {
  std::string output =
      ".Dd " + std::string(date) + "\n.Dt ORV 1\n.Os\n.Sh NAME\n.Nm orv\n.Nd " + line.summary + '\n';
  output += ".Sh SYNOPSIS\n" + synopsis(line);
  output += ".Sh DESCRIPTION\n" + prose(line.text) + ".Pp\n" + prose(formatsText);
  output += ".Pp\nThe options outside of the commands are:\n" + optionList(line.options);
  for (const CommandDescription& command : line.commands) output += commandSection(command);
  output += ".Sh ENVIRONMENT\n.Bl -tag -width Ds\n.It Ev NO_COLOR\n";
  output += prose("if it is not empty, nothing is coloured unless --color always asks for it.") + ".El\n";
  output += ".Sh EXIT STATUS\n.Bl -tag -width Ds\n";
  for (const StatusDescription& status : statusDescriptions) {
    output += ".It " + std::to_string(status.status) + '\n' + prose(std::string(status.meaning) + '.');
  }
  return output + ".El\n.Sh EXAMPLES\n" + exampleList(line);
}

}  // namespace orv::tool

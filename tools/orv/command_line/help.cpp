#include "tools/orv/command_line/command.hpp"

#include <unistd.h>

#include <algorithm>
#include <utility>
#include <vector>

#include <orv/spelling/nearest_name.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/output/output_file.hpp"
#include "tools/orv/output/palette.hpp"

namespace orv::tool {

namespace {

// Lines longer than this are hard to read, whatever room there is.
constexpr std::size_t widest = 100;
constexpr std::size_t narrowest = 40;

std::size_t columnsFor(std::size_t width) { return width == 0 ? 80 : std::clamp(width, narrowest, widest); }

// Words from the column `start` on, where the first line stands already, set in lines up to `width`.
std::string wrapped(std::string_view words, std::size_t start, std::size_t width) {
  std::string text;
  std::size_t column = start;
  while (!words.empty()) {
    const std::string_view word = words.substr(0, words.find(' '));
    words.remove_prefix(std::min(words.size(), word.size() + 1));
    if (column != start && column + 1 + word.size() > width) {
      text += '\n';
      text.append(start, ' ');
      column = start;
    }
    if (column != start) text += ' ';
    column += word.size() + (column != start ? 1 : 0);
    text += word;
  }
  return text + '\n';
}

// A table of two columns; the second begins a line of its own where the first is too long.
class Table {
 public:
  explicit Table(std::size_t width) : width_(width) {}

  void add(std::string_view left, std::string_view right) { rows_.emplace_back(left, right); }

  std::string text() const {
    const std::size_t longestLeft = std::min<std::size_t>(width_ / 3, 26);
    std::size_t leftWidth = 0;
    for (const auto& [left, right] : rows_) {
      if (left.size() <= longestLeft) leftWidth = std::max(leftWidth, left.size());
    }
    const std::size_t start = 2 + leftWidth + 2;
    std::string text;
    for (const auto& [left, right] : rows_) {
      text += "  " + left;
      if (left.size() <= leftWidth) {
        text.append(leftWidth - left.size() + 2, ' ');
      } else {
        text += '\n';
        text.append(start, ' ');
      }
      text += wrapped(right, start, width_);
    }
    return text;
  }

 private:
  std::size_t width_;
  std::vector<std::pair<std::string, std::string>> rows_;
};

std::string optionColumn(const OptionDescription& option) {
  const std::string letter = option.letter == '\0' ? "    " : std::string("-") + option.letter + ", ";
  const std::string value = option.valueName.empty() ? "" : ' ' + std::string(option.valueName);
  return letter + std::string(option.name) + value;
}

std::string optionsText(std::span<const OptionDescription* const> options, const Command& command,
                        std::size_t width) {
  Table table(width);
  for (const auto* const option : options) table.add(optionColumn(*option), textOf(*option, command));
  return "\nOptions:\n" + table.text();
}

}  // namespace

std::string helpText(std::size_t width) {
  const std::size_t columns = columnsFor(width);
  const CommandTable& table = commandTable;
  std::string text = "Usage: orv [COMMAND] [OPTION]... [FILE]...\n\n" + wrapped(table.text, 0, columns);
  Table commands(columns);
  for (const Command& command : table.commands) commands.add(command.name, command.summary);
  text += "\nCommands:\n" + commands.text();
  text += optionsText(table.options, table.commands.front(), columns);
  text += "\nFormats:\n  " + wrapped(table.formats, 2, columns);
  Table statuses(columns);
  for (const StatusDescription& status : table.statuses)
    statuses.add(std::to_string(static_cast<int>(status.status)), status.meaning);
  text += "\nExit status:\n" + statuses.text();
  text += "\nExamples:\n";
  for (const Command& command : table.commands)
    text += "  " + std::string(command.examples.front().line) + '\n';
  return text + "\n\"orv help COMMAND\" tells more of each command.\n";
}

std::string helpText(const Command& command, std::size_t width) {
  const std::size_t columns = columnsFor(width);
  std::string text =
      "Usage: orv " + std::string(command.name) + " [OPTION]..." + std::string(textOf(command.operands));
  text += "\n\n" + wrapped(command.text, 0, columns) + optionsText(command.options, command, columns);
  text += "\nExamples:\n";
  for (const Example& example : command.examples) {
    if (example.line.empty()) break;
    text += "  " + std::string(example.line) + "\n      " + wrapped(example.text, 6, columns);
  }
  return text;
}

ExitStatus runHelp(const Options& options) {
  const std::size_t width = terminalWidth(STDOUT_FILENO);
  if (options.files.empty()) return writeWhole(helpText(width));
  const std::string& name = options.files.front();
  if (const Command* const command = findCommand(name)) return writeWhole(helpText(*command, width));
  report({ExitStatus::usage, "orv: help: no command " + spelling::quotedText(name) +
                                 spelling::suggestion(name, commandTable.commands, &Command::name)});
  return ExitStatus::usage;
}

}  // namespace orv::tool

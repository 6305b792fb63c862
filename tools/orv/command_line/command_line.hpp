// The command line, read and explained. All of it is made of the table of commands.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <variant>

#include "tools/orv/command_line/command.hpp"

namespace orv::tool {

// Work: a command and its options, which are complete.
struct Request {
  const Command* command;
  Options options;
};

// Text that was asked for in place of work: help, the version, the manual page, the completion.
struct Answer {
  std::string text;
};

std::variant<Request, Answer, Failure> parseCommandLine(int argumentCount, const char* const* arguments);

// The text of --help, set for a terminal of so many columns; 0 stands for 80.
std::string helpText(std::size_t width);
std::string helpText(const Command& command, std::size_t width);

// The manual page in mdoc(7). The date is that of its contents: "November 22, 2025".
std::string manPage(std::string_view date);

// A script that completes the command in bash.
std::string bashCompletion();

}  // namespace orv::tool

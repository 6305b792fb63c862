// What the command line offers, in words: help and manual page are made of it.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace orv::tool {

struct OptionDescription {
  std::string names;      // "-t,--type"
  std::string valueName;  // "TYPE"; empty for a flag
  std::string text;       // a sentence without its full stop
};

struct ExampleDescription {
  std::string line;
  std::string text;
};

struct CommandDescription {
  std::string name;
  std::string summary;   // a few words
  std::string text;      // sentences
  std::string operands;  // "[FILE]..."
  std::vector<OptionDescription> options;
  std::vector<ExampleDescription> examples;
};

struct CommandLineDescription {
  std::string summary;
  std::string text;
  std::vector<OptionDescription> options;
  std::vector<CommandDescription> commands;
};

struct StatusDescription {
  int status;
  std::string_view meaning;
};

inline constexpr StatusDescription statusDescriptions[] = {
    {0, "done, or equal"},
    {1, "different (diff)"},
    {2, "the command line is wrong"},
    {3, "input that is no message"},
    {4, "a file that cannot be read or written"},
};

inline constexpr std::string_view formatsText =
    "The formats are binary, hex (digits with white space and 0x between bytes, as xxd -p prints them), "
    "base64, text "
    "(the text format of Protocol Buffers) and json (its JSON mapping). With --delimited, input and output "
    "are streams: "
    "in the first three formats each message stands behind its length as a varint, JSON documents follow one "
    "another, "
    "one a line in the output, and messages in the text format each follow a line that begins with \"# "
    "message\".";

}  // namespace orv::tool

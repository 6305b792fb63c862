#include "tools/orv/command_texts.hpp"

#include <array>

namespace orv::tool {

namespace {

constexpr std::array<std::string_view, 8> names{"decode", "encode",   "inspect", "convert",
                                                "diff",   "identify", "types",   "schema"};

}  // namespace

std::vector<std::string_view> commandNames() { return {names.begin(), names.end()}; }

CommandLineDescription describeCommandLine() {
  CommandLineDescription line;
  line.summary = "see, make, convert and compare the messages of an invitation";
  line.text =
      "Shows the messages of the invitation protocol as text or JSON, makes them from either, explains their "
      "bytes and "
      "compares them. Without a command it decodes. Files are named, - is standard input, and so is no file. "
      "The "
      "payload of an envelope is shown as the message that the envelope's type names; that of a "
      "connectionResponse is "
      "a ConnectionResponse.Content.";
  line.options = {{"-h,--help", "", "show this help"}, {"--version", "", "show the version"}};
  line.commands = {
      {.name = "decode",
       .summary = "show messages as text or JSON",
       .text =
           "Reads messages in their binary encoding and shows them as text or JSON, with the payload of an "
           "envelope in place of its data.",
       .operands = "[FILE]...",
       .options = {},
       .examples = {{"orv decode --delimited capture.bin", "shows the messages of a capture"},
                    {"orv --delimited --to json capture.bin | jq .type", "the types of its messages"},
                    {"echo 0a05636172 6f6c | orv --from hex -t Member",
                     "shows a member given in hexadecimal digits"}}},
      {.name = "encode",
       .summary = "make messages of text or JSON",
       .text = "Reads messages as text or JSON and writes their binary encoding. The data of an envelope may "
               "be its "
               "payload as a message or an object, or its bytes as a string.",
       .operands = "[FILE]...",
       .options = {},
       .examples = {{R"(echo '{"handle":"carol"}' | orv encode -t Member --to hex)",
                     "a member in hexadecimal digits"},
                    {"orv --to json message.bin | jq '.version = 2' | orv encode -o changed.bin",
                     "changes a message"}}},
      {.name = "inspect",
       .summary = "explain messages byte by byte",
       .text = "Shows the bytes of each field with their offset, the field's path, its kind and its value, "
               "and the "
               "payload of an envelope in its place. Malformed bytes are shown up to the error.",
       .operands = "[FILE]...",
       .options = {},
       .examples = {{"orv inspect --delimited capture.bin", "explains the messages of a capture"},
                    {"orv inspect --color always message.bin | less -R", "keeps the colours for a pager"}}},
      {.name = "convert",
       .summary = "change the format of messages",
       .text = "Reads messages in one format and writes them in another. Bytes that stay bytes are checked "
               "and kept as "
               "they are.",
       .operands = "[FILE]...",
       .options = {},
       .examples = {{"orv convert --from hex --to binary dump.txt -o message.bin",
                     "bytes out of a hexadecimal dump"},
                    {"orv convert --from json --to text message.json", "JSON as text"}}},
      {.name = "diff",
       .summary = "compare two messages",
       .text = "Shows the fields that differ: ~ changed, - only in A, + only in B. Messages are equal as the "
               "model has "
               "it: texts when they are canonically equivalent, whatever their bytes.",
       .operands = "A B",
       .options = {},
       .examples = {{"orv diff before.bin after.bin", "the fields that differ"},
                    {"orv diff -q --bytes before.bin after.bin",
                     "whether anything does, encodings included"}}},
      {.name = "identify",
       .summary = "rank the types that bytes could be",
       .text = "Ranks the types that a bare payload could be by the share of its bytes that they explain.",
       .operands = "[FILE]...",
       .options = {},
       .examples = {{"orv identify payload.bin", "the types that these bytes could be"}}},
      {.name = "types",
       .summary = "list the message types with their fields",
       .text =
           "Lists the message types, all or those named, with the numbers, names and kinds of their fields.",
       .operands = "[TYPE]...",
       .options = {},
       .examples = {{"orv types Group", "the fields of one type"}}},
      {.name = "schema",
       .summary = "print the schema",
       .text = "Prints the schema of the protocol, for peers in other languages.",
       .operands = "",
       .options = {},
       .examples = {{"orv schema -o orv.proto", "a file for protoc"}}},
  };
  return line;
}

}  // namespace orv::tool

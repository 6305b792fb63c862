#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <limits>

#include <orv/spelling/value_text.hpp>
#include "tools/orv/command_line/command.hpp"

namespace orv::tool {

namespace {

using Taken = std::expected<void, std::string>;

Taken refuse(std::string_view value, std::string_view reason) {
  return std::unexpected(spelling::quotedText(value) + " " + std::string(reason));
}

Taken takeType(Options& options, const Command&, std::string_view name) {
  const auto type = findMessageType(name);
  if (!type) return std::unexpected(type.error());
  options.type = *type;
  return {};
}

template <std::optional<Format> Options::*format, FormatChoice Command::*choice>
Taken takeFormat(Options& options, const Command& command, std::string_view name) {
  const auto allowed = (command.*choice).allowed;
  const auto found = std::ranges::find(allowed, name, [](Format one) { return nameOf(one); });
  if (found == allowed.end()) return refuse(name, "is none of " + listed({.allowed = allowed}));
  options.*format = *found;
  return {};
}

constexpr std::array<std::string_view, 3> colourNames{"auto", "always", "never"};

Taken takeColour(Options& options, const Command&, std::string_view when) {
  const auto* const found = std::ranges::find(colourNames, when);
  if (found == colourNames.end()) return refuse(when, "is none of auto, always, never");
  options.colour = static_cast<ColourChoice>(found - colourNames.begin());
  return {};
}

// A number of bytes: digits, and K, M or G for powers of 1024, also as KB and KiB.
std::optional<std::size_t> sizeInBytes(std::string_view text) {
  std::size_t number = 0;
  const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (status != std::errc()) return std::nullopt;
  std::string unit(end, text.data() + text.size());
  std::ranges::transform(unit, unit.begin(),
                         [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  constexpr std::string_view letters = "kmg";
  const auto power = unit.empty() ? std::string_view::npos : letters.find(unit[0]);
  const std::string_view rest = std::string_view(unit).substr(power == std::string_view::npos ? 0 : 1);
  if (!rest.empty() && rest != "b" && (rest != "ib" || power == std::string_view::npos)) return std::nullopt;
  const std::size_t shift = power == std::string_view::npos ? 0 : 10 * (power + 1);
  if (number > std::numeric_limits<std::size_t>::max() >> shift) return std::nullopt;
  return number << shift;
}

Taken takeMaximumSize(Options& options, const Command&, std::string_view given) {
  const auto size = sizeInBytes(given);
  if (!size) return refuse(given, "is no size (1000000, 64KiB, 1G)");
  options.maximumSize = *size;
  return {};
}

Taken takeOutput(Options& options, const Command&, std::string_view path) {
  options.output = path;
  return {};
}

Taken takeInnerType(Options& options, const Command&, std::string_view pairing) {
  const auto equals = pairing.find('=');
  if (equals == std::string_view::npos) return refuse(pairing, "is not FIELD=TYPE");
  const auto type = findMessageType(pairing.substr(equals + 1));
  if (!type) return std::unexpected(type.error());
  options.innerTypes[std::string(pairing.substr(0, equals))] = *type;
  return {};
}

Taken takeIgnored(Options& options, const Command&, std::string_view path) {
  options.ignored.emplace_back(path);
  return {};
}

Taken takeCondition(Options& options, const Command&, std::string_view condition) {
  options.selection.addCondition(condition);
  return {};
}

Taken leaveClosed(Options& options, const Command&, std::string_view) {
  options.payloads.leaveClosed();
  return {};
}

template <bool Options::*flag>
Taken set(Options& options, const Command&, std::string_view) {
  options.*flag = true;
  return {};
}

constexpr char noLetter = '\0';
constexpr std::string_view flag;  // the value's name of an option without a value

constexpr OptionDescription type{'t', "--type", "TYPE",
                                 "the message type, for instance Group.MemberAdded (default SessionMessage)",
                                 takeType};
constexpr OptionDescription payload{
    noLetter, "--payload", "[KIND=]TYPE",
    "the type of an envelope's payload, for one kind or for all that have none",
    [](Options& options, const Command&, std::string_view pairing) {
      return options.payloads.override(pairing);
    }};
constexpr OptionDescription as{
    noLetter, "--as", "FIELD=TYPE",
    "explain a field's bytes as a message, for instance data.encryptedData that is decrypted", takeInnerType};
constexpr OptionDescription noUnwrap{noLetter, "--no-unwrap", flag, "leave the payloads of envelopes bytes",
                                     leaveClosed};
constexpr OptionDescription from{
    noLetter,      "--from", "FORMAT", "the input's format", takeFormat<&Options::from, &Command::from>,
    &Command::from};
constexpr OptionDescription to{
    noLetter, "--to", "FORMAT", "the output's format", takeFormat<&Options::to, &Command::to>, &Command::to};
constexpr OptionDescription delimited{'d', "--delimited", flag, "read and write streams of messages",
                                      set<&Options::isDelimited>};
constexpr OptionDescription messages{'n', "--messages", "N[-[M]]",
                                     "take the messages of a stream from the Nth to the Mth",
                                     [](Options& options, const Command&, std::string_view range) {
                                       return options.selection.addNumbers(range);
                                     }};
constexpr OptionDescription only{
    noLetter, "--only", "KIND|FIELD[=VALUE]",
    "take envelopes of the kind, or messages with the field, or with the value in it", takeCondition};
constexpr OptionDescription verbose{noLetter, "--verbose", flag, "say which format an input is read in",
                                    set<&Options::isVerbose>};
constexpr OptionDescription keepGoing{
    'k', "--keep-going", flag, "go on behind malformed messages of a stream", set<&Options::keepsGoing>};
constexpr OptionDescription unknown{noLetter, "--unknown", flag, "show unknown fields in JSON",
                                    set<&Options::showsUnknownFields>};
constexpr OptionDescription defaults{noLetter, "--defaults", flag,
                                     "show fields that are absent, with their defaults",
                                     set<&Options::showsDefaults>};
constexpr OptionDescription redact{noLetter, "--redact", flag,
                                   "hide the values of secret and of unknown fields, but not their lengths",
                                   set<&Options::hidesSecrets>};
constexpr OptionDescription bytes{noLetter, "--bytes", flag, "compare the encodings too",
                                  set<&Options::comparesEncodings>};
constexpr OptionDescription ignore{
    noLetter, "--ignore", "PATH",
    "leave out a field and what is in it, of every item of lists without [INDEX]", takeIgnored};
constexpr OptionDescription quiet{'q', "--quiet", flag, "say nothing, the exit status tells",
                                  set<&Options::isQuiet>};
constexpr OptionDescription colour{
    noLetter, "--color", "WHEN", "auto (default), always, never", takeColour, nullptr, "auto always never"};
constexpr OptionDescription maximumSize{noLetter, "--max-size", "SIZE",
                                        "the most bytes that a message may have (default 16MiB)",
                                        takeMaximumSize};
constexpr OptionDescription output{'o', "--output", "FILE", "write to the file (default standard output)",
                                   takeOutput};
// Both are answered in place of work.
constexpr OptionDescription help{'h', "--help", flag, "show this help", nullptr};
constexpr OptionDescription version{'V', "--version", flag, "show the version", nullptr};

template <class... Options>
constexpr std::array<const OptionDescription*, sizeof...(Options)> list(const Options&... options) {
  return {&options...};
}
constexpr auto generalOptions = list(help, version);
constexpr auto decodeOptions = list(type, payload, noUnwrap, from, to, delimited, messages, only, keepGoing,
                                    unknown, redact, verbose, maximumSize, output, help);
constexpr auto encodeOptions =
    list(type, payload, from, to, delimited, messages, only, keepGoing, verbose, maximumSize, output, help);
constexpr auto inspectOptions = list(type, payload, as, noUnwrap, from, to, delimited, messages, only,
                                     keepGoing, defaults, redact, colour, verbose, maximumSize, output, help);
constexpr auto diffOptions = list(type, payload, noUnwrap, from, delimited, messages, only, ignore, bytes,
                                  quiet, colour, verbose, maximumSize, output, help);
constexpr auto identifyOptions = list(from, delimited, messages, keepGoing, maximumSize, output, help);
constexpr auto printingOptions = list(help);

constexpr std::array allFormats{Format::binary, Format::hex, Format::base64, Format::text, Format::json};
constexpr auto byteFormats = std::span(allFormats).first<3>();
constexpr auto readableFormats = std::span(allFormats).last<2>();
constexpr std::array shownFormats{Format::text, Format::json, Format::html};

constexpr Command commands[] = {
    {.name = "decode",
     .run = runConvert,
     .summary = "show messages as text or JSON",
     .text = "Reads messages in their binary encoding and shows them as text or JSON, with the payload of an "
             "envelope in place of its data.",
     .operands = Operands::files,
     .from = {.allowed = allFormats, .isGuessed = true},
     .to = {.allowed = readableFormats, .byDefault = Format::text},
     .options = decodeOptions,
     .examples = {{{"orv decode --delimited capture.bin", "shows the messages of a capture"},
                   {"orv --delimited --to json capture.bin | jq .type", "the types of its messages"},
                   {"echo 0a05636172 6f6c | orv --from hex -t Member",
                    "shows a member given in hexadecimal digits"}}}},
    {.name = "encode",
     .run = runConvert,
     .summary = "make messages of text or JSON",
     .text =
         "Reads messages as text or JSON and writes their binary encoding. The data of an envelope may be "
         "its payload as a message or an object, or its bytes as a string.",
     .operands = Operands::files,
     .from = {.allowed = readableFormats, .isGuessed = true},
     .to = {.allowed = byteFormats, .byDefault = Format::binary},
     .options = encodeOptions,
     .examples = {{{R"(echo '{"handle":"carol"}' | orv encode -t Member --to hex)",
                    "a member in hexadecimal digits"},
                   {"orv --to json message.bin | jq '.version = 2' | orv encode -o changed.bin",
                    "changes a message"}}}},
    {.name = "inspect",
     .run = runInspect,
     .summary = "explain messages byte by byte",
     .text = "Shows the bytes of each field with their offset, the field's path, its kind and its value, and "
             "the payload of an envelope in its place. Malformed bytes are shown up to the error.",
     .operands = Operands::files,
     .from = {.allowed = allFormats, .isGuessed = true},
     .to = {.allowed = shownFormats, .byDefault = Format::text},
     .options = inspectOptions,
     .examples = {{{"orv inspect --delimited capture.bin", "explains the messages of a capture"},
                   {"orv inspect --to html message.bin -o message.html", "a page to attach to a report"},
                   {"orv inspect --color always message.bin | less -R", "keeps the colours for a pager"}}}},
    {.name = "convert",
     .run = runConvert,
     .summary = "change the format of messages",
     .text = "Reads messages in one format and writes them in another. Bytes that stay bytes are checked and "
             "kept as they are.",
     .operands = Operands::files,
     .from = {.allowed = allFormats, .isGuessed = true},
     .to = {.allowed = allFormats, .byDefault = Format::text},
     .options = decodeOptions,
     .examples = {{{"orv convert --to binary dump.txt -o message.bin", "bytes out of a hexadecimal dump"},
                   {"orv convert message.json", "JSON as text"}}}},
    {.name = "diff",
     .run = runDiff,
     .summary = "compare two messages",
     .text = "Shows the fields that differ: ~ changed, - only in A, + only in B. Messages of streams and "
             "items of "
             "lists are aligned, so that a missing one is one line. Messages are equal as the "
             "model has it: texts when they are canonically equivalent, whatever their bytes.",
     .operands = Operands::twoFiles,
     .from = {.allowed = allFormats, .isGuessed = true},
     .options = diffOptions,
     .examples = {{{"orv diff before.bin after.bin", "the fields that differ"},
                   {"orv diff --ignore version before.bin after.bin", "but for one field"},
                   {"orv diff -q --bytes before.bin after.bin",
                    "whether anything does, encodings included"}}}},
    {.name = "identify",
     .run = runIdentify,
     .summary = "rank the types that bytes could be",
     .text = "Ranks the types that a bare payload could be by the share of its bytes that they explain.",
     .operands = Operands::files,
     .from = {.allowed = byteFormats, .byDefault = Format::binary},
     .options = identifyOptions,
     .examples = {{{"orv identify payload.bin", "the types that these bytes could be"}}}},
    {.name = "types",
     .run = runTypes,
     .summary = "list the message types with their fields",
     .text =
         "Lists the message types, all or those named, with the numbers, names and kinds of their fields.",
     .operands = Operands::types,
     .options = printingOptions,
     .examples = {{{"orv types Group", "the fields of one type"}}}},
    {.name = "schema",
     .run = runSchema,
     .summary = "print the schema",
     .text = "Prints the schema of the protocol, for peers in other languages.",
     .operands = Operands::none,
     .options = printingOptions,
     .examples = {{{"orv schema > orv.proto", "a file for protoc"}}}},
    {.name = "help",
     .run = runHelp,
     .summary = "tell more of a command",
     .text = "Shows the help of a command, as its option --help does, or of all.",
     .operands = Operands::command,
     .options = printingOptions,
     .examples = {{{"orv help diff", "the options of diff"}}}},
};

constexpr StatusDescription statuses[] = {
    {ExitStatus::done, "done, or equal"},
    {ExitStatus::different, "different (diff)"},
    {ExitStatus::usage, "the command line is wrong"},
    {ExitStatus::malformed, "input that is no message"},
    {ExitStatus::fileError, "a file that cannot be read or written"},
};

}  // namespace

constinit const CommandTable commandTable{
    .summary = "see, make, convert and compare the messages of an invitation",
    .text =
        "Shows the messages of the invitation protocol as text or JSON, makes them from either, explains "
        "their bytes and compares them. Without a command it decodes. Files are named, - is standard input, "
        "and so is no file. The payload of an envelope is shown as the message that the envelope's type "
        "names; that of a connectionResponse is a ConnectionResponse.Content.",
    .formats =
        "The formats are binary, hex (digits however they are pasted: with commas, colons or 0x between "
        "them, as an array or a string with escapes, as a dump of xxd or hexdump -C), base64, text (the text "
        "format of Protocol Buffers) and json (its JSON mapping). With "
        "--delimited, input and output are streams: in the first three formats each message stands "
        "behind its length as a varint, JSON documents follow one another, one a line in the output, and "
        "messages in the text format each follow a line that begins with \"# message\".",
    .options = generalOptions,
    .commands = commands,
    .statuses = statuses,
};

const Command* findCommand(std::string_view name) {
  const auto* const found = std::ranges::find(commands, name, &Command::name);
  return found == std::end(commands) ? nullptr : found;
}

std::string listed(const FormatChoice& formats) {
  std::string names;
  for (const Format format : formats.allowed) {
    if (!names.empty()) names += ", ";
    names += nameOf(format);
    if (format == formats.byDefault) names += " (default)";
  }
  return names;
}

std::string textOf(const OptionDescription& option, const Command& command) {
  std::string text(option.text);
  if (option.formats == nullptr) return text;
  const FormatChoice& formats = command.*option.formats;
  return text + (formats.isGuessed ? ", if not as it begins: " : ": ") + listed(formats);
}

}  // namespace orv::tool

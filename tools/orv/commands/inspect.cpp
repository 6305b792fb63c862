// inspect.
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include <orv/byte_view.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/inspect/dump_layout.hpp"
#include "tools/orv/inspect/trace.hpp"

namespace orv::tool {

namespace {

// In the order of ValueType; what is unknown is called by its wire type.
constexpr std::array<std::string_view, 6> typeNames{"string", "bytes", "bool", "uint32", "enum", "message"};

// In the order of WireType.
constexpr std::array<std::string_view, 6> wireTypeNames{"varint", "fixed64", "bytes",
                                                        "group",  "group",   "fixed32"};

std::string_view kindOf(const TracedRecord& record) {
  if (record.type) return typeNames[static_cast<std::size_t>(*record.type)];
  return wireTypeNames[static_cast<std::size_t>(record.tag.wireType())];
}

std::string byteCount(std::size_t count) { return std::to_string(count) + (count == 1 ? " byte" : " bytes"); }

// How many bytes, and which, if they can be read.
std::string describeBytes(std::string_view bytes) {
  std::string text = byteCount(bytes.size());
  if (!bytes.empty() && spelling::isReadable(bytes)) text += " " + spelling::quotedText(bytes);
  return text;
}

std::string describeMessage(std::span<const std::byte> bytes, const MessageDescriptor& type) {
  return byteCount(bytes.size()) + ", " + std::string(type.fullName);
}

std::string describeUnknown(const TracedRecord& record) {
  const std::string text =
      record.field != nullptr ? "another wire type than the field's, kept as unknown: " : "unknown: ";
  switch (record.tag.wireType()) {
    case WireType::lengthDelimited: return text + describeBytes(charactersOf(record.value));
    case WireType::startGroup: return text + byteCount(record.value.size());
    default: return text + std::to_string(record.number);
  }
}

std::string describeValue(const TracedRecord& record) {
  if (!record.type) return describeUnknown(record);
  switch (*record.type) {
    case ValueType::string: return spelling::quotedText(charactersOf(record.value));
    case ValueType::bytes: return describeBytes(charactersOf(record.value));
    case ValueType::boolean: return record.number != 0 ? "true" : "false";
    case ValueType::uint32: return std::to_string(static_cast<std::uint32_t>(record.number));
    case ValueType::enumeration: break;
    case ValueType::message: return describeMessage(record.value, *record.field->message);
  }
  const std::string number = std::to_string(static_cast<std::int32_t>(record.number));
  const std::string_view name = record.caseName();
  return name.empty() ? number : std::string(name) + " (" + number + ")";
}

// Writes an annotated dump of one message: a row, or as many as it takes, for each record, and the payload of
// an envelope in its place.
class Dump final : public TraceSink {
 public:
  // Offsets are shown from `offset` on.
  Dump(OutputFile& output, const DumpLayout& layout, std::span<const std::byte> message, std::uint64_t offset)
      : output_(output), layout_(layout), message_(message), offset_(offset), shownUpTo_(message.data()) {}

  // Malformed bytes are shown up to the error, with the error where it stands; that is the answer then.
  Outcome<std::optional<DecodeError>> show(const MessageType& type, const PayloadPairing& payloads) {
    if (type.isEnvelope()) {
      const EnvelopeOutline outline = outlineOf(message_);
      payload_ = outline.data ? payloads.payloadOf(outline.type) : nullptr;
      if (payload_ != nullptr) payloadStart_ = outline.data->data();
    }
    if (const auto traced = trace(type, message_, *this); !traced) error_ = traced.error();
    if (written_ && error_) showError(*error_);
    if (!written_) return std::unexpected(written_.error());
    return error_;
  }

  bool record(const TracedRecord& record) override {
    const bool isPayload = depth_ == 0 && payload_ != nullptr && record.type == ValueType::bytes &&
                           record.value.data() == payloadStart_;
    const bool isOpened = isPayload || record.type == ValueType::message;
    const DumpLayout::Note note{
        .depth = depth_,
        .path = record.path,
        .kind = kindOf(record),
        .value = isPayload ? describeMessage(record.value, *payload_->descriptor) : describeValue(record),
        .colour = record.type ? Palette::Colour::value : Palette::Colour::unknown};
    const auto shownValue = isOpened ? record.value.first(0) : record.value;
    layout_.appendRecord(rows_, {offsetOf(record.header.data()), record.header, shownValue, note.colour},
                         note);
    writeRows();
    shownUpTo_ = record.value.data() + shownValue.size();
    return written_ && (!isPayload || showPayload(record.value));
  }

 private:
  bool showPayload(std::span<const std::byte> data) {
    ++depth_;
    const auto traced = trace(*payload_, data, *this);
    --depth_;
    if (traced) return *traced;
    error_ = traced.error();
    error_->offset += static_cast<std::size_t>(data.data() - message_.data());
    return false;
  }

  // The bytes that no row has shown yet, from the record that went wrong on, as far as they help.
  void showError(const DecodeError& error) {
    constexpr std::size_t most = 32;
    const auto rest = message_.subspan(static_cast<std::size_t>(shownUpTo_ - message_.data()));
    const std::byte* const errorAt = message_.data() + error.offset;
    const auto before = static_cast<std::size_t>(std::clamp<std::ptrdiff_t>(errorAt - shownUpTo_, 0, most));
    const auto shown = rest.first(std::min(rest.size(), most));
    if (!rest.empty()) {
      DumpLayout::Note note{
          .depth = depth_, .path = {}, .kind = {}, .value = {}, .colour = Palette::Colour::error};
      if (rest.size() != shown.size()) note.value = "… " + byteCount(rest.size() - shown.size()) + " more";
      layout_.appendRecord(
          rows_, {offsetOf(shownUpTo_), shown.first(before), shown.subspan(before), note.colour}, note);
    }
    layout_.appendError(rows_, "error at " + bytePlace(offset_ + error.offset) + ": " + error.path.text() +
                                   ": " + error.reason());
    writeRows();
  }

  void writeRows() {
    written_ = output_.write(rows_);
    rows_.clear();
  }

  std::uint64_t offsetOf(const std::byte* at) const {
    return offset_ + static_cast<std::uint64_t>(at - message_.data());
  }

  OutputFile& output_;
  const DumpLayout& layout_;
  std::span<const std::byte> message_;
  std::uint64_t offset_;
  const std::byte* shownUpTo_;
  const MessageType* payload_ = nullptr;  // of the envelope that is shown
  const std::byte* payloadStart_ = nullptr;
  std::optional<DecodeError> error_;
  std::size_t depth_ = 0;
  std::string rows_;  // not yet written
  Outcome<void> written_;
};

class Inspection final : public MessageWork {
 public:
  Inspection(const Options& options, OutputFile& output)
      : options_(options),
        output_(output),
        layout_(terminalWidth(descriptor()), Palette(options.colour, descriptor())) {}

  Outcome<void> take(const MessageInput& message) override {
    std::string line = message.frame().number > 1 ? "\n" : "";
    layout_.appendHeading(line, heading(message));
    if (auto written = output_.write(line); !written) return written;
    Dump dump(output_, layout_, bytesOf(message.encoding()), message.encodingOffset());
    const auto shown = dump.show(*options_.type, options_.payloads);
    if (!shown) return std::unexpected(shown.error());
    if (shown->has_value()) return std::unexpected(message.failureOf(**shown));
    return {};
  }

  // Where a stream ends in a piece that is no message, the dump says so too.
  Outcome<void> takeEnd(const Failure& failure) override {
    if (failure.status != ExitStatus::malformed) return {};
    std::string line;
    layout_.appendError(line, spelling::printable(failure.line));
    return output_.write(line);
  }

 private:
  int descriptor() const { return options_.output ? -1 : STDOUT_FILENO; }

  std::string heading(const MessageInput& message) const {
    std::string text;
    if (options_.files.size() > 1) text += spelling::printable(message.path()) + ": ";
    if (options_.isDelimited) text += "message " + std::to_string(message.frame().number) + ": ";
    text += options_.type->fullName();
    return text + ", " + std::to_string(message.encoding().size()) + " bytes";
  }

  const Options& options_;
  OutputFile& output_;
  DumpLayout layout_;
};

}  // namespace

ExitStatus runInspect(const Options& options) {
  OutputFile output(options.output);
  Inspection inspection(options, output);
  return forEachMessage(options, output, inspection);
}

}  // namespace orv::tool

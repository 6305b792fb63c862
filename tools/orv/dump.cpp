#include "tools/orv/dump.hpp"

#include <algorithm>
#include <array>
#include <string>

#include <orv/utf8.hpp>
#include "tools/orv/value_text.hpp"

namespace orv::tool {

namespace {

// In the order of FieldUse; what is unknown is called by its wire type.
constexpr std::array<std::string_view, 6> useNames{"string", "bytes", "bool", "uint32", "enum", "message"};

// In the order of WireType.
constexpr std::array<std::string_view, 6> wireTypeNames{"varint", "fixed64", "bytes",
                                                        "group",  "group",   "fixed32"};

std::string byteCount(std::size_t count) { return std::to_string(count) + (count == 1 ? " byte" : " bytes"); }

std::string_view characters(std::span<const std::byte> bytes) {
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

// How many bytes, and which, if they can be read.
std::string describeBytes(std::span<const std::byte> bytes) {
  std::string text = byteCount(bytes.size());
  if (!bytes.empty() && isReadable(characters(bytes))) text += " " + quotedText(characters(bytes));
  return text;
}

std::string describeUnknown(const TracedRecord& record) {
  const std::string text =
      record.isDefined ? "another wire type than the field's, kept as unknown: " : "unknown: ";
  switch (record.tag.wireType()) {
    case WireType::lengthDelimited: return text + describeBytes(record.value);
    case WireType::startGroup: return text + byteCount(record.value.size());
    default: return text + std::to_string(record.number);
  }
}

std::string describeValue(const TracedRecord& record) {
  switch (record.use) {
    case FieldUse::string: return quotedText(characters(record.value));
    case FieldUse::bytes: return describeBytes(record.value);
    case FieldUse::boolean: return record.number != 0 ? "true" : "false";
    case FieldUse::uint32: return std::to_string(static_cast<std::uint32_t>(record.number));
    case FieldUse::enumeration: {
      const std::string number = std::to_string(static_cast<std::int32_t>(record.number));
      return record.name.empty() ? number : std::string(record.name) + " (" + number + ")";
    }
    case FieldUse::message: return byteCount(record.value.size()) + ", " + std::string(record.name);
    case FieldUse::unknown: break;
  }
  return describeUnknown(record);
}

std::string_view kindOf(const TracedRecord& record) {
  if (record.use != FieldUse::unknown) return useNames[static_cast<std::size_t>(record.use)];
  return wireTypeNames[static_cast<std::size_t>(record.tag.wireType())];
}

}  // namespace

Outcome<std::optional<DecodeError>> Dump::show(const MessageType& type, const PayloadPairing& payloads) {
  if (&type == &typeOf<SessionMessage>()) {
    SessionMessage envelope;
    // Of a malformed envelope, what can be read.
    (void)envelope.merge(message_);
    payload_ = payloads.payloadOf(envelope);
    payloadStart_ = payloadBytes(message_).data();
  }
  const auto traced = trace(type, message_, *this);
  if (!traced) error_ = traced.error();
  if (written_ && error_) showError(*error_);
  if (!written_) return std::unexpected(written_.error());
  return error_;
}

bool Dump::record(const TracedRecord& record) {
  const bool isPayload = depth_ == 0 && payload_ != nullptr && record.use == FieldUse::bytes &&
                         record.value.data() == payloadStart_;
  const bool isOpened = isPayload || record.use == FieldUse::message;
  DumpLayout::Note note{
      .depth = depth_, .path = record.path, .kind = kindOf(record), .value = describeValue(record)};
  if (isPayload) note.value = byteCount(record.value.size()) + ", " + std::string(payload_->fullName);
  if (record.use == FieldUse::unknown) note.colour = Palette::Colour::unknown;
  const auto shownValue = isOpened ? record.value.first(0) : record.value;
  std::string rows;
  layout_.appendRecord(rows, {offsetOf(record.header.data()), record.header, shownValue, note.colour}, note);
  write(rows);
  shownUpTo_ = record.value.data() + shownValue.size();
  if (!written_) return false;
  return !isPayload || showPayload(record);
}

bool Dump::showPayload(const TracedRecord& data) {
  ++depth_;
  const auto traced = trace(*payload_, data.value, *this);
  --depth_;
  if (traced) return *traced;
  error_ = traced.error();
  error_->offset += static_cast<std::size_t>(data.value.data() - message_.data());
  return false;
}

// The bytes that no row has shown yet, from the record that went wrong on, as far as they help.
void Dump::showError(const DecodeError& error) {
  constexpr std::size_t most = 32;
  const auto rest = message_.subspan(static_cast<std::size_t>(shownUpTo_ - message_.data()));
  const std::byte* const errorAt = message_.data() + error.offset;
  const auto before = static_cast<std::size_t>(std::clamp<std::ptrdiff_t>(errorAt - shownUpTo_, 0, most));
  const std::size_t shown = std::min(rest.size(), most);
  std::string rows;
  if (!rest.empty()) {
    const std::size_t left = rest.size() - shown;
    DumpLayout::Note note{.depth = depth_, .path = {}, .kind = {}, .value = {}};
    if (left != 0) note.value = "… " + byteCount(left) + " more";
    note.colour = Palette::Colour::error;
    layout_.appendRecord(
        rows, {offsetOf(shownUpTo_), rest.first(before), rest.first(shown).subspan(before), note.colour},
        note);
  }
  layout_.appendError(rows, "error at " + bytePlace(offset_ + error.offset) + ": " + error.path.text() +
                                ": " + error.reason());
  write(rows);
}

void Dump::write(std::string_view text) {
  if (written_) written_ = output_.write(text);
}

}  // namespace orv::tool

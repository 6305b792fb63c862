#include "tools/orv/trace.hpp"

#include <cassert>

#include <orv/utf8.hpp>
#include "tools/orv/tracing_decoder.hpp"

namespace orv::tool {

namespace {

using Trace = std::expected<bool, DecodeError>(std::span<const std::byte>, TraceSink&);

constexpr auto traceAs = functionPerType<Trace>([]<class M>() -> Trace* {
  return [](std::span<const std::byte> bytes, TraceSink& sink) -> std::expected<bool, DecodeError> {
    TracingDecoder decoder(bytes, sink);
    M message;
    const auto traced = message.decodeMessage(decoder);
    if (traced) return true;
    if (traced.error() == TracingDecoder::Error::stopped) return false;
    const auto parsed = M::parse(bytes);
    assert(!parsed);
    return std::unexpected(parsed.error());
  };
});

constexpr auto malformed = std::unexpected(TracingDecoder::Error::malformed);

std::string_view characters(std::span<const std::byte> bytes) {
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace

std::expected<bool, DecodeError> trace(const MessageType& type, std::span<const std::byte> bytes,
                                       TraceSink& sink) {
  return traceAs[type.index](bytes, sink);
}

std::expected<std::optional<std::uint32_t>, TracingDecoder::Error> TracingDecoder::nextNumber() {
  if (hasField_ && reader_.position() == valueStart_) {
    if (auto traced = traceUnknown(); !traced) return std::unexpected(traced.error());
  }
  hasField_ = false;
  if (reader_.isAtEnd()) return std::nullopt;
  recordStart_ = reader_.position();
  const auto tag = reader_.readTag();
  if (!tag) return malformed;
  hasField_ = true;
  tag_ = *tag;
  valueStart_ = reader_.position();
  return tag->fieldNumber();
}

TracingDecoder::Result TracingDecoder::traceText(bool isRepeated) {
  if (tag_.wireType() != WireType::lengthDelimited) return {};
  const auto body = readBody();
  if (!body) return std::unexpected(body.error());
  if (!utf8::isWellFormed(characters(*body))) return malformed;
  setPath(isRepeated);
  return report(FieldUse::string, *body, 0, {});
}

TracingDecoder::Result TracingDecoder::traceBytes() {
  if (tag_.wireType() != WireType::lengthDelimited) return {};
  const auto body = readBody();
  if (!body) return std::unexpected(body.error());
  setPath(false);
  return report(FieldUse::bytes, *body, 0, {});
}

TracingDecoder::Result TracingDecoder::traceVarint(FieldUse use, const NameMap* names) {
  if (tag_.wireType() != WireType::varint) return {};
  const auto varint = reader_.readVarint();
  if (!varint) return malformed;
  setPath(false);
  std::string_view name;
  if (names != nullptr) name = names->name(static_cast<std::int32_t>(*varint)).value_or(std::string_view());
  return report(use, {valueStart_, reader_.position()}, *varint, name);
}

TracingDecoder::Result TracingDecoder::traceUnknown() {
  if (const auto skipped = reader_.skipValue(tag_, recordStart_, nesting_); !skipped) return malformed;
  setPath(false);
  std::span<const std::byte> value(valueStart_, reader_.position());
  std::uint64_t number = 0;
  WireReader again(value);
  if (tag_.wireType() == WireType::varint) number = *again.readVarint();
  if (tag_.wireType() == WireType::fixed32) number = *again.readFixed32();
  if (tag_.wireType() == WireType::fixed64) number = *again.readFixed64();
  if (tag_.wireType() == WireType::lengthDelimited) value = *again.readLengthDelimited();
  return report(FieldUse::unknown, value, number, {});
}

std::expected<std::span<const std::byte>, TracingDecoder::Error> TracingDecoder::readBody() {
  const auto body = reader_.readLengthDelimited();
  if (!body) return malformed;
  return *body;
}

void TracingDecoder::setPath(bool isRepeated) {
  const FieldDescriptor* const field = message_->field(tag_.fieldNumber());
  path_ = prefix_;
  path_ += field != nullptr ? std::string(field->name) : std::to_string(tag_.fieldNumber());
  if (isRepeated) path_ += '[' + std::to_string(occurrences_[tag_.fieldNumber()]++) + ']';
}

TracingDecoder::Result TracingDecoder::report(FieldUse use, std::span<const std::byte> value,
                                              std::uint64_t number, std::string_view name) {
  const bool goesOn = sink_.record({.use = use,
                                    .tag = tag_,
                                    .path = path_,
                                    .isDefined = message_->field(tag_.fieldNumber()) != nullptr,
                                    .header = {recordStart_, value.data()},
                                    .value = value,
                                    .number = number,
                                    .name = name});
  if (!goesOn) return std::unexpected(Error::stopped);
  return {};
}

}  // namespace orv::tool

#include "tools/orv/messages/salvage.hpp"

#include <string_view>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/delimited_stream.hpp>
#include <orv/utf8.hpp>
#include <orv/wire_reader.hpp>

namespace orv::tool {

namespace {

// Makes a well-formed encoding of what stands before the error. Messages that the error is in end there.
class Salvager {
 public:
  Salvager(const MessageType* payload, CutFields cut)
      : payload_(payload), takesCut_(cut == CutFields::take) {}

  bool hasKnownFields() const { return hasKnownFields_; }
  const std::string& cut() const { return cut_; }

  // False where there is an error, in the message or in one that it holds.
  bool takeFields(const MessageDescriptor& type, std::span<const std::byte> bytes, int nesting,
                  std::string& output) {
    WireReader reader(bytes);
    while (!reader.isAtEnd()) {
      const std::byte* const start = reader.position();
      const auto tag = reader.readTag();
      if (!tag) return false;
      const FieldDescriptor* const field = type.field(tag->fieldNumber());
      const bool isKnown = field != nullptr && tag->wireType() == wireTypeOf(field->type);
      if (isKnown && tag->wireType() == WireType::lengthDelimited) {
        const std::span header(start, reader.position());
        if (!takeContents(*field, charactersOf(header), reader, nesting, output)) return false;
      } else {
        if (!reader.skipValue(*tag, start, nesting)) return false;
        output += charactersOf(std::span(start, reader.position()));
        hasKnownFields_ = hasKnownFields_ || isKnown;
      }
    }
    return true;
  }

 private:
  bool takeContents(const FieldDescriptor& field, std::string_view tag, WireReader& reader, int nesting,
                    std::string& output) {
    cut_.clear();
    WireReader start = reader;
    auto body = reader.readLengthDelimited();
    const bool isWhole = body.has_value();
    if (!isWhole) {
      if (!takesCut_ || !start.readVarint()) return false;
      body = std::span(start.position(), start.remaining());
    }
    std::string_view contents = charactersOf(*body);
    const bool isPayload = payload_ != nullptr && nesting == 0 && field.type == ValueType::bytes;
    const MessageDescriptor* const inner = isPayload ? payload_->descriptor : field.message;
    std::string fields;
    bool isGood = isWhole;
    if (inner != nullptr) {
      isGood = takeFields(*inner, *body, nesting + 1, fields) && isWhole;
      contents = fields;
      if (!cut_.empty()) cut_.insert(0, std::string(field.name) + '.');
    } else {
      if (field.type == ValueType::string) contents = contents.substr(0, utf8::wellFormedPrefix(contents));
      isGood = isWhole && contents.size() == body->size();
      if (!isGood && (!takesCut_ || contents.empty())) return false;
      if (!isGood) cut_ = field.name;
    }
    hasKnownFields_ = true;
    output += tag;
    // The envelope goes on behind an error in its payload.
    return appendDelimited(contents, output) && (isGood || (isPayload && isWhole));
  }

  const MessageType* payload_;  // of the envelope that the message is
  bool takesCut_;
  bool hasKnownFields_ = false;
  std::string cut_;
};

}  // namespace

std::optional<Salvage> salvage(const MessageType& type, std::span<const std::byte> bytes,
                               const PayloadPairing& payloads, CutFields cut) {
  Salvager salvager(type.isEnvelope() ? payloads.payloadOf(outlineOf(bytes).type) : nullptr, cut);
  std::string encoding;
  (void)salvager.takeFields(*type.descriptor, bytes, 0, encoding);
  if (!salvager.hasKnownFields()) return std::nullopt;
  auto message = parseMessage(type, bytesOf(encoding), payloads);
  if (!message) return std::nullopt;
  return Salvage{.message = std::move(*message), .cut = salvager.cut()};
}

}  // namespace orv::tool

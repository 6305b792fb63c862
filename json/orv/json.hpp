// Messages as JSON, in the proto3 mapping (protobuf.dev, "ProtoJSON Format"), and back. Names are the text
// names exactly: "wantsTokenURI", "groupUUID".
#pragma once

#include <expected>
#include <string>
#include <string_view>
#include <utility>

#include <orv/json/document.hpp>
#include <orv/json/document_decoder.hpp>
#include <orv/json/error.hpp>
#include <orv/json/renderer.hpp>

namespace orv::inline v0::json {

// The message as one JSON object, without a line end. What the binary encoding leaves out is left out here:
// absent fields, empty lists, fields with implicit presence at their default.
template <class M>
std::string render(const M& message, RenderOptions options = {}) {
  std::string output;
  Renderer(output, options).render(message);
  return output;
}

// Reads fields from the document's object into a new message. An object that names a field twice, a field
// that M does not have, a value of another type, a second member of a oneof: each is an error.
template <class M>
[[nodiscard]] std::expected<M, Error> read(Value object) {
  M message;
  DocumentDecoder decoder(object);
  if (auto decoded = message.decodeMessage(decoder); !decoded)
    return std::unexpected(std::move(decoded.error()));
  return message;
}

// As read, from the text of a document.
template <class M>
[[nodiscard]] std::expected<M, Error> parse(std::string_view text,
                                            const DecodeLimits& limits = DecodeLimits::none()) {
  const auto document = Document::parse(text, limits);
  if (!document) return std::unexpected(document.error());
  return read<M>(document->root());
}

}  // namespace orv::json

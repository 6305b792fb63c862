// The rules of all messages for the built-in decoders and visitors. Only the sources of the messages include
// this: each compiles them for its types, with one line per type, and whoever includes a message's header
// compiles none of them.
#pragma once

#include <algorithm>
#include <array>
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <span>
#include <string>

#include <orv/internal/replacing.hpp>
#include <orv/message.hpp>

namespace orv {

template <class M>
std::expected<void, DecodeError> Message<M>::decodeMessage(BinaryDecoder& decoder) {
  if (decodeFields(decoder)) [[likely]]
    return {};
  return decoder.failure();
}

template <class M>
BinaryEncoder::Result Message<M>::traverse(BinaryEncoder& visitor) const {
  return visitFields(visitor);
}

template <class M>
SizeCounter::Result Message<M>::traverse(SizeCounter& visitor) const {
  return visitFields(visitor);
}

template <class M>
HashVisitor::Result Message<M>::traverse(HashVisitor& visitor) const {
  return visitFields(visitor);
}

template <class M>
TextRenderer::Result Message<M>::traverse(TextRenderer& visitor) const {
  return visitFields(visitor);
}

template <class M>
void Message<M>::hash(Hasher& into) const {
  HashVisitor visitor(into);
  (void)traverse(visitor);
}

template <class M>
std::uint64_t Message<M>::hashValue() const {
  Hasher hasher;
  hash(hasher);
  return hasher.finish();
}

template <class M>
std::string Message<M>::debugDescription() const {
  std::string text;
  TextRenderer renderer(text, _protobuf_nameMap());
  (void)traverse(renderer);
  return text;
}

template <class M>
std::expected<M, DecodeError> Message<M>::parse(std::span<const std::byte> bytes) {
  std::expected<M, DecodeError> message;
  BinaryDecoder decoder(bytes);
  if (!message->decodeFields(decoder)) [[unlikely]]
    message = std::unexpected(decoder.failure().error());
  return message;
}

template <class M>
std::expected<void, DecodeError> Message<M>::reparse(std::span<const std::byte> bytes) {
  BinaryDecoder decoder(bytes);
  if (replaceFields(decoder)) [[likely]]
    return {};
  return decoder.failure();
}

template <class M>
std::expected<void, DecodeError> Message<M>::merge(std::span<const std::byte> bytes) {
  BinaryDecoder decoder(bytes);
  if (decodeFields(decoder)) [[likely]]
    return {};
  return decoder.failure();
}

template <class M>
std::expected<std::string, EncodeError> Message<M>::serialize() const {
  // Most messages fit here, and then their string is allocated once, at its final size.
  std::array<std::byte, 1024> buffer;
  BinaryEncoder encoder(buffer, BinaryEncoder::Guesses::bold);
  if (visitFields(encoder))
    return std::string(reinterpret_cast<const char*>(buffer.data()), encoder.finish());
  // Larger ones are counted first.
  const std::size_t size = encodedSize();
  if (size > BinaryEncoder::largestEncoding) return std::unexpected(EncodeError::tooLarge);
  std::string bytes;
  bytes.resize_and_overwrite(size, [&](char* target, std::size_t room) {
    const auto written = serializeInto(std::as_writable_bytes(std::span(target, room)));
    assert(written == size);
    return written.value_or(0);
  });
  return bytes;
}

template <class M>
std::expected<std::size_t, EncodeError> Message<M>::serializeInto(std::span<std::byte> buffer) const {
  BinaryEncoder encoder(buffer, BinaryEncoder::Guesses::bold);
  if (!visitFields(encoder)) [[unlikely]]
    return serializeCarefully(buffer);
  encoder.wipeOverrun();
  return encoder.finish();
}

// For where it may have been a bold guess that took too much room.
template <class M>
std::expected<std::size_t, EncodeError> Message<M>::serializeCarefully(std::span<std::byte> buffer) const {
  BinaryEncoder encoder(buffer, BinaryEncoder::Guesses::careful);
  if (const auto walked = visitFields(encoder); !walked) {
    std::ranges::fill(buffer, std::byte{0});
    return std::unexpected(walked.error());
  }
  encoder.wipeOverrun();
  return encoder.finish();
}

template <class M>
std::size_t Message<M>::encodedSize() const {
  SizeCounter counter;
  (void)traverse(counter);
  return counter.size();
}

}  // namespace orv

#include <orv/internal/field_writer.hpp>

namespace orv::inline v0::internal {

namespace {

std::uint32_t tagValue(std::uint32_t number, WireType type) {
  return number << 3 | static_cast<std::uint32_t>(type);
}

char* writeVarint(std::uint64_t value, char* at) {
  for (; value >= 0x80; value >>= 7) *at++ = static_cast<char>(value | 0x80);
  *at++ = static_cast<char>(value);
  return at;
}

char* writeTag(std::uint32_t number, WireType type, char* at) {
  return writeVarint(tagValue(number, type), at);
}

}  // namespace

FieldWriter::Place FieldWriter::writeUnknown(const UnknownStorage& unknownFields, char* at, char* limit,
                                             Target& target) {
  const std::span<const std::byte> records = unknownFields.records();
  Place place = makeRoom(records.size(), at, limit, target);
  if (place.at == nullptr) return place;
  std::memcpy(place.at, records.data(), records.size());
  place.at += records.size();
  return place;
}

FieldWriter::Place FieldWriter::writeLongBytes(std::string_view bytes, std::uint32_t number, char* at,
                                               char* limit, Target& target) {
  if (number < shortNumbers && bytes.size() < mediumVarints &&
      static_cast<std::size_t>(limit - at) >= 3 + bytes.size()) [[likely]] {
    *at++ = shortTag(number, WireType::lengthDelimited);
    if (bytes.size() >= shortVarints) *at++ = static_cast<char>((bytes.size() & 0x7F) | 0x80);
    *at++ = static_cast<char>(bytes.size() >= shortVarints ? bytes.size() >> 7 : bytes.size());
    std::memcpy(at, bytes.data(), bytes.size());
    return {at + bytes.size(), limit};
  }
  const std::size_t head = varintSize(tagValue(number, WireType::lengthDelimited)) + varintSize(bytes.size());
  Place place = makeRoom(head + bytes.size(), at, limit, target);
  if (place.at == nullptr) return place;
  place.at = writeVarint(bytes.size(), writeTag(number, WireType::lengthDelimited, place.at));
  std::memcpy(place.at, bytes.data(), bytes.size());
  place.at += bytes.size();
  return place;
}

FieldWriter::Place FieldWriter::writeLongNumber(std::uint64_t value, std::uint32_t number, char* at,
                                                char* limit, Target& target) {
  Place place =
      makeRoom(varintSize(tagValue(number, WireType::varint)) + varintSize(value), at, limit, target);
  if (place.at == nullptr) return place;
  place.at = writeVarint(value, writeTag(number, WireType::varint, place.at));
  return place;
}

FieldWriter::Place FieldWriter::beginLongNested(std::uint32_t number, std::size_t lengthBytes, char* at,
                                                char* limit, Target& target) {
  const std::size_t size = varintSize(tagValue(number, WireType::lengthDelimited)) + lengthBytes;
  Place place = makeRoom(size, at, limit, target);
  if (place.at == nullptr) return place;
  place.at = writeTag(number, WireType::lengthDelimited, place.at) + lengthBytes;
  return place;
}

// The body, which begins at `start` of the encoding, needs another number of length bytes than was guessed.
FieldWriter::Place FieldWriter::endLongNested(std::size_t start, std::size_t guessed, char* at, char* limit,
                                              Target& target) {
  const std::size_t length = static_cast<std::size_t>(at - target.begin) - start;
  const std::size_t needed = varintSize(length);
  Place place{at, limit};
  if (needed > guessed) {
    place = makeRoom(needed - guessed, at, limit, target);
    if (place.at == nullptr) return place;
  }
  char* const body = target.begin + start;
  char* const lengthAt = body - guessed;
  if (needed != guessed) std::memmove(lengthAt + needed, body, length);
  place.at = writeVarint(length, lengthAt) + length;
  if (needed < guessed) {
    // What was left behind the message did not move with it.
    const auto room = static_cast<std::size_t>(place.limit - place.at);
    std::memset(place.at, 0, std::min(room, InlineBytes::objectSize + guessed - needed));
  }
  return place;
}

FieldWriter::Place FieldWriter::makeRoom(std::size_t size, char* at, char* limit, Target& target) {
  if (static_cast<std::size_t>(limit - at) >= size) return {at, limit};
  const auto kept = static_cast<std::size_t>(at - target.begin);
  const std::size_t needed = kept + size;
  if (needed > Target::largestEncoding) {
    target.error = EncodeError::tooLarge;
    return {nullptr, nullptr};
  }
  if (target.growing == nullptr) {
    target.error = EncodeError::bufferTooSmall;
    return {nullptr, nullptr};
  }
  constexpr std::size_t firstGrowth = 256;
  const std::size_t capacity = std::min(std::max({needed, 2 * kept, firstGrowth}), Target::largestEncoding);
  const auto before = static_cast<std::size_t>(target.begin - target.growing->data());
  target.growing->resize(before + capacity);
  target.begin = target.growing->data() + before;
  return {target.begin + kept, target.begin + capacity};
}

}  // namespace orv::internal

#include <orv/binary_encoder.hpp>

#include <google/protobuf/io/coded_stream.h>

#include <algorithm>

namespace orv {

namespace {

using google::protobuf::io::CodedOutputStream;

std::uint32_t tagValue(std::uint32_t number, WireType type) {
  return number << 3 | static_cast<std::uint32_t>(type);
}

char* writeTag(std::uint32_t number, WireType type, char* target) {
  auto* const bytes = reinterpret_cast<std::uint8_t*>(target);
  return reinterpret_cast<char*>(CodedOutputStream::WriteTagToArray(tagValue(number, type), bytes));
}

char* writeVarint(std::uint64_t value, char* target) {
  auto* const bytes = reinterpret_cast<std::uint8_t*>(target);
  return reinterpret_cast<char*>(CodedOutputStream::WriteVarint64ToArray(value, bytes));
}

}  // namespace

void BinaryEncoder::trimString() { growing_->resize(static_cast<std::size_t>(cursor_ - growing_->data())); }

BinaryEncoder::Result BinaryEncoder::visitUnknownFields(const UnknownStorage& unknownFields) {
  const std::span<const std::byte> records = unknownFields.records();
  if (auto roomy = makeRoom(records.size()); !roomy) return roomy;
  std::memcpy(cursor_, records.data(), records.size());
  cursor_ += records.size();
  return {};
}

BinaryEncoder::Result BinaryEncoder::writeLongBytes(std::string_view bytes, std::uint32_t number) {
  const std::size_t size = varintSize(tagValue(number, WireType::lengthDelimited)) + varintSize(bytes.size());
  if (auto roomy = makeRoom(size + bytes.size()); !roomy) return roomy;
  cursor_ = writeVarint(bytes.size(), writeTag(number, WireType::lengthDelimited, cursor_));
  std::memcpy(cursor_, bytes.data(), bytes.size());
  cursor_ += bytes.size();
  return {};
}

BinaryEncoder::Result BinaryEncoder::writeLongNumber(std::uint64_t value, std::uint32_t number) {
  const std::size_t size = varintSize(tagValue(number, WireType::varint)) + varintSize(value);
  if (auto roomy = makeRoom(size); !roomy) return roomy;
  cursor_ = writeVarint(value, writeTag(number, WireType::varint, cursor_));
  return {};
}

BinaryEncoder::Result BinaryEncoder::beginLongNested(std::uint32_t number, std::size_t lengthBytes) {
  const std::size_t size = varintSize(tagValue(number, WireType::lengthDelimited)) + lengthBytes;
  if (auto roomy = makeRoom(size); !roomy) return roomy;
  cursor_ = writeTag(number, WireType::lengthDelimited, cursor_) + lengthBytes;
  return {};
}

BinaryEncoder::Result BinaryEncoder::endLongNested(std::size_t start, std::size_t& lengthBytes) {
  const std::size_t length = written() - start;
  const std::size_t needed = varintSize(length);
  if (needed > lengthBytes) {
    if (auto roomy = makeRoom(needed - lengthBytes); !roomy) return roomy;
  }
  char* const body = begin_ + start;
  char* const lengthAt = body - lengthBytes;
  if (needed != lengthBytes) std::memmove(lengthAt + needed, body, length);
  cursor_ = writeVarint(length, lengthAt) + length;
  if (needed < lengthBytes) {
    // What was left behind the message did not move with it.
    std::memset(cursor_, 0, std::min(room(), longestOverrun + lengthBytes - needed));
  }
  lengthBytes = needed;
  return {};
}

BinaryEncoder::Result BinaryEncoder::grow(std::size_t size) {
  const std::size_t needed = written() + size;
  if (size > largestEncoding || needed > largestEncoding) return std::unexpected(EncodeError::tooLarge);
  if (growing_ == nullptr) return std::unexpected(EncodeError::bufferTooSmall);
  constexpr std::size_t firstGrowth = 256;
  const std::size_t capacity = std::min(std::max({needed, 2 * written(), firstGrowth}), largestEncoding);
  const std::size_t kept = written();
  const auto before = static_cast<std::size_t>(begin_ - growing_->data());
  growing_->resize_and_overwrite(before + capacity, [](char*, std::size_t all) { return all; });
  begin_ = growing_->data() + before;
  cursor_ = begin_ + kept;
  limit_ = begin_ + capacity;
  return {};
}

}  // namespace orv

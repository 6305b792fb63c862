#include <orv/unknown_storage.hpp>

#include <algorithm>
#include <cstring>
#include <new>

#include <orv/internal/varint.hpp>

namespace orv::inline v0 {

std::expected<UnknownStorage, DecodeError> UnknownStorage::checked(std::span<const std::byte> records) {
  UnknownStorage storage;
  if (auto appended = storage.append(records); !appended) return std::unexpected(appended.error());
  return storage;
}

std::expected<void, DecodeError> UnknownStorage::append(std::span<const std::byte> records) {
  WireReader reader(records);
  const auto error = [&](const WireFault& fault) {
    return std::unexpected(DecodeError{.cause = fault.cause,
                                       .length = fault.length,
                                       .detail = fault.detail,
                                       .offset = static_cast<std::size_t>(fault.at - records.data())});
  };
  while (!reader.isAtEnd()) {
    const std::byte* const tagStart = reader.position();
    const auto tag = reader.readTag();
    if (!tag) return error(tag.error());
    if (const auto skipped = reader.skipValue(*tag, tagStart, 0); !skipped) return error(skipped.error());
  }
  appendRecords(records);
  return {};
}

void UnknownStorage::appendRecords(std::span<const std::byte> records) {
  if (records.empty()) return;
  const std::size_t oldSize = this->records().size();
  const std::size_t size = oldSize + records.size();
  if (block_ != nullptr && size <= block_->capacity) {
    std::memmove(bytes() + oldSize, records.data(), records.size());
    block_->size = size;
    return;
  }
  // A first record is stored exactly; a store that grows is doubled.
  const std::size_t capacity = std::max(size, 2 * oldSize);
  auto* const larger = static_cast<Block*>(::operator new(sizeof(Block) + capacity));
  *larger = {size, capacity};
  auto* const target = reinterpret_cast<std::byte*>(larger + 1);
  if (oldSize != 0) std::memcpy(target, bytes(), oldSize);
  std::memcpy(target + oldSize, records.data(), records.size());
  if (block_ != nullptr) freeBlock();
  block_ = larger;
}

bool UnknownStorage::hasSameRecords(const UnknownStorage& other) const {
  const std::span<const std::byte> left = records();
  const std::span<const std::byte> right = other.records();
  return left.size() == right.size() && std::memcmp(left.data(), right.data(), left.size()) == 0;
}

bool UnknownField::isShortest() const {
  const std::size_t tagSize = record.size() - value.size();
  if (tagSize != internal::varintSize(tag.value)) return false;
  // What is kept is well-formed.
  WireReader reader(value);
  switch (tag.wireType()) {
    case WireType::varint: return value.size() == internal::varintSize(*reader.readVarint());
    case WireType::fixed64:
    case WireType::fixed32: return true;
    case WireType::lengthDelimited: {
      const std::size_t length = reader.readLengthDelimited()->size();
      return value.size() == internal::varintSize(length) + length;
    }
    case WireType::startGroup:
      for (UnknownStorage::Iterator inner(value);; ++inner) {
        if (inner->tag.wireType() == WireType::endGroup) return inner->record.size() == tagSize;
        if (!inner->isShortest()) return false;
      }
    case WireType::endGroup: break;  // not covered: it stands in no record of its own
  }
  return true;  // not covered: as above
}

void UnknownStorage::freeBlock() noexcept { ::operator delete(block_); }

UnknownStorage::Iterator& UnknownStorage::Iterator::operator++() {
  isAtEnd_ = reader_.isAtEnd();
  if (isAtEnd_) return *this;
  const std::byte* const start = reader_.position();
  // A store holds well-formed records only.
  field_.tag = *reader_.readTag();
  const std::byte* const value = reader_.position();
  [[maybe_unused]] const auto skipped = reader_.skipValue(field_.tag, start, 0);
  field_.record = std::span(start, reader_.position());
  field_.value = std::span(value, reader_.position());
  return *this;
}

}  // namespace orv

// The fields that were read but that a message does not define.
#pragma once

#include <cstddef>
#include <expected>
#include <iterator>
#include <span>
#include <utility>

#include <orv/decode_error.hpp>
#include <orv/internal/seam.hpp>
#include <orv/internal/standard.hpp>
#include <orv/wire_reader.hpp>

namespace orv::inline v0 {

namespace internal {
class FieldReader;
}

// One kept field. The spans are valid as long as the store that they come from is unchanged.
struct UnknownField {
  Tag tag;
  std::span<const std::byte> record;  // as it came: tag, length and overlong spellings included
  std::span<const std::byte> value;   // what follows the tag

  // Whether all tags, lengths and varints in the record, and in the groups in it, are as short as they can be: then
  // number, wire type and value say all of it.
  bool isShortest() const;
};

// Kept records, byte for byte as they came, in the order of their arrival; they are well-formed always. Owns
// one heap block, and none before there was something to keep; it is one pointer wide.
class UnknownStorage {
 public:
  constexpr UnknownStorage() noexcept = default;
  UnknownStorage(const UnknownStorage& other) {
    if (!other.isEmpty()) appendRecords(other.records());
  }
#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"  // as of InlineBytes
#endif
  UnknownStorage(UnknownStorage&& other) noexcept : block_(other.block_) { other.block_ = nullptr; }
#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic pop
#endif
  UnknownStorage& operator=(const UnknownStorage& other) {
    if (this != &other) *this = UnknownStorage(other);
    return *this;
  }
  UnknownStorage& operator=(UnknownStorage&& other) noexcept {
    UnknownStorage taken(std::move(other));
    std::swap(block_, taken.block_);
    return *this;
  }
  constexpr ~UnknownStorage() {
    if (block_ != nullptr) freeBlock();
  }

  // Takes a sequence of records, which must be well-formed: this is how a program sets unknown fields itself.
  // Groups may be nested 100 deep here; in a message that is itself nested n deep, only 100-n of them are
  // read again.
  [[nodiscard]] static std::expected<UnknownStorage, DecodeError> checked(std::span<const std::byte> records);

  // Adds records behind those that are there; nothing, unless all are well-formed.
  [[nodiscard]] std::expected<void, DecodeError> append(std::span<const std::byte> records);

  bool isEmpty() const { return block_ == nullptr || block_->size == 0; }
  std::span<const std::byte> records() const ORV_BOUND {
    return block_ == nullptr ? std::span<const std::byte>()
                             : std::span<const std::byte>(bytes(), block_->size);
  }
  // Empties the store, whose memory is used again.
  void clear() {
    if (block_ != nullptr) block_->size = 0;
  }

  // Walks the fields one by one: for (const UnknownField& field : store).
  class Iterator;
  Iterator begin() const ORV_BOUND;
  std::default_sentinel_t end() const { return {}; }

  // Hands the kept records to the visitor, if there are any.
  template <class V>
  [[gnu::always_inline]] internal::ResultOf<V> traverse(V& visitor) const {
    if (isEmpty()) [[likely]]
      return {};
    return visitor.visitUnknownFields(*this);
  }

  friend bool operator==(const UnknownStorage& left, const UnknownStorage& right) {
    if (left.isEmpty() || right.isEmpty()) return left.isEmpty() && right.isEmpty();
    return left.hasSameRecords(right);
  }

 private:
  friend internal::FieldReader;

  // Stands at the start of the heap block; the records follow it.
  struct Block {
    std::size_t size;
    std::size_t capacity;
  };

  // Adds records that are known to be well-formed.
  void appendRecords(std::span<const std::byte> records);
  std::byte* bytes() const { return reinterpret_cast<std::byte*>(block_ + 1); }
  bool hasSameRecords(const UnknownStorage& other) const;
  void freeBlock() noexcept;

  Block* block_ = nullptr;
};

// Walks the kept fields. It is valid as long as the store is unchanged.
class UnknownStorage::Iterator {
 public:
  using difference_type = std::ptrdiff_t;
  using value_type = UnknownField;

  Iterator() = default;
  explicit Iterator(std::span<const std::byte> records) : reader_(records) { ++*this; }

  const UnknownField& operator*() const ORV_BOUND { return field_; }
  const UnknownField* operator->() const ORV_BOUND { return &field_; }
  Iterator& operator++();
  void operator++(int) { ++*this; }
  friend bool operator==(const Iterator& iterator, std::default_sentinel_t) { return iterator.isAtEnd_; }

 private:
  WireReader reader_;
  UnknownField field_{};
  bool isAtEnd_ = false;
};

inline UnknownStorage::Iterator UnknownStorage::begin() const { return Iterator(records()); }

}  // namespace orv

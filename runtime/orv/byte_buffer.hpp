// A sequence of bytes.
#pragma once

#include <cstddef>
#include <functional>
#include <span>
#include <string_view>

#include <orv/hasher.hpp>
#include <orv/internal/inline_bytes.hpp>

namespace orv::inline v0 {

namespace internal {
class FieldReader;
class FieldWriter;
}  // namespace internal

// An immutable sequence of bytes with value semantics: it changes only by being assigned another. Two buffers
// are equal when they have the same length and the same bytes. A buffer of up to 39 bytes allocates nothing.
class ByteBuffer {
 public:
  constexpr ByteBuffer() noexcept = default;
  // NOLINTNEXTLINE(google-explicit-constructor): a span converts freely
  ByteBuffer(std::span<const std::byte> bytes) {
    bytes_.assign({reinterpret_cast<const char*>(bytes.data()), bytes.size()});
  }
  // Takes the characters as bytes, whatever they spell.
  explicit ByteBuffer(std::string_view characters) { bytes_.assign(characters); }

  std::size_t size() const { return bytes_.size(); }
  bool isEmpty() const { return size() == 0; }
  // Both views are valid until the buffer is assigned to or destroyed.
  std::span<const std::byte> bytes() const { return std::as_bytes(std::span(characters())); }
  std::string_view characters() const { return bytes_.view(); }
  // `index` is less than size().
  std::byte operator[](std::size_t index) const { return static_cast<std::byte>(characters()[index]); }

  friend ByteBuffer operator+(const ByteBuffer& left, const ByteBuffer& right) {
    ByteBuffer joined = left;
    joined.bytes_.append(right.characters());
    return joined;
  }
  friend bool operator==(const ByteBuffer& left, const ByteBuffer& right) {
    return left.bytes_ == right.bytes_;
  }
  void hash(Hasher& into) const { into.combine(characters()); }

 private:
  friend internal::FieldReader;
  friend internal::FieldWriter;

  internal::InlineBytes bytes_;
};

}  // namespace orv

template <>
struct std::hash<orv::ByteBuffer> : orv::internal::StandardHash<orv::ByteBuffer> {};

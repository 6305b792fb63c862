// Bytes: a view of somebody else's, and a sequence that owns its own.
#pragma once

#include <compare>
#include <concepts>
#include <cstddef>
#include <functional>
#include <iosfwd>
#include <iterator>
#include <span>
#include <string_view>
#include <type_traits>

#include <orv/hasher.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

class ByteBuffer;

namespace internal {
class FieldReader;
class FieldWriter;

template <class T>
concept ByteSized = std::same_as<T, char> || std::same_as<T, signed char> || std::same_as<T, unsigned char> ||
    std::same_as<T, std::byte> || std::same_as<T, char8_t>;
template <class R>
concept SpannedBytes = requires(R& range) {
  requires ByteSized<typename decltype(std::span(range))::value_type>;
};
template <class R>
concept ByteRange = SpannedBytes<R> && !std::is_array_v<R>;
// One that is a view itself, and need not last as long as what is made of it.
template <class R>
concept BorrowedBytes = ByteRange<R> && std::ranges::enable_borrowed_range<R>;
// One that can be written to.
template <class R>
concept ByteRoom = SpannedBytes<R> && requires(R& range) {
  std::as_writable_bytes(std::span(range));
};
template <class B>
concept ByteArray = std::is_bounded_array_v<B> && ByteSized<std::remove_cv_t<std::remove_extent_t<B>>>;

}  // namespace internal

// Bytes that lie one behind the other in memory, wherever they come from: the parameter of all that reads
// bytes. It is made of a string, a vector, a span, an array or any other contiguous range whose elements are
// one byte wide, and is valid as long as that one is. A pointer makes none: it does not say where it ends.
class ByteView {
 public:
  constexpr ByteView() = default;  // of no bytes
  template <internal::ByteRange R>
  ByteView(const R& range ORV_BOUND)  // NOLINT(google-explicit-constructor): any bytes are a view of them
      : ByteView(std::span<const std::byte>(std::as_bytes(std::span(range)))) {}
  template <internal::BorrowedBytes R>
  ByteView(const R& range)  // NOLINT(google-explicit-constructor)
      : ByteView(std::span<const std::byte>(std::as_bytes(std::span(range)))) {}
  // NOLINTNEXTLINE(google-explicit-constructor)
  constexpr ByteView(std::string_view characters) : characters_(characters) {}
  // NOLINTNEXTLINE(google-explicit-constructor)
  ByteView(std::span<const std::byte> bytes)
      : characters_(reinterpret_cast<const char*>(bytes.data()), bytes.size()) {}
  // An array, whole; but an array of constant characters is a literal, and the NUL behind it not part of it.
  template <internal::ByteArray Array>
  ByteView(Array& array)  // NOLINT(google-explicit-constructor)
      : ByteView(std::as_bytes(std::span(array).first(std::size(array) - (isLiteral(array) ? 1 : 0)))) {}

  std::span<const std::byte> bytes() const { return std::as_bytes(std::span(characters_)); }
  constexpr std::string_view characters() const { return characters_; }
  constexpr std::size_t size() const { return characters_.size(); }

 private:
  template <class Array>
  static bool isLiteral(Array& array) {
    using Element = std::remove_extent_t<Array>;
    if constexpr (std::same_as<Element, const char> || std::same_as<Element, const char8_t>)
      return *std::rbegin(array) == 0;
    else
      return false;
  }

  std::string_view characters_;
};

inline namespace literals {

// A literal as bytes, zeros in it included: "\x0a\x00"_bytes.
constexpr ByteView operator""_bytes(const char* characters, std::size_t size) {
  return std::string_view(characters, size);
}

}  // namespace literals

namespace internal {
template <class B>
concept OtherBytes = !std::same_as<std::remove_cvref_t<B>, ByteBuffer> && std::convertible_to<B, ByteView>;
}

// An immutable sequence of bytes with value semantics: it changes only by being assigned another. Two buffers
// are equal when they have the same length and the same bytes, and ordered as these are, byte by byte. A
// buffer of up to 39 bytes allocates nothing.
class ByteBuffer {
 public:
  constexpr ByteBuffer() noexcept = default;
  // Copies whatever a ByteView is made of.
  template <internal::OtherBytes Bytes>
  ByteBuffer(Bytes&& bytes) {  // NOLINT(google-explicit-constructor): bytes convert freely
    bytes_.assign(ByteView(bytes).characters());
  }

  std::size_t size() const { return bytes_.size(); }
  bool isEmpty() const { return size() == 0; }
  bool empty() const { return isEmpty(); }
  // The views, the pointer and the iterators are valid until the buffer is assigned to or destroyed.
  std::span<const std::byte> bytes() const ORV_BOUND { return std::as_bytes(std::span(characters())); }
  std::string_view characters() const ORV_BOUND { return bytes_.view(); }
  const std::byte* data() const ORV_BOUND { return bytes().data(); }
  const std::byte* begin() const ORV_BOUND { return data(); }
  const std::byte* end() const ORV_BOUND { return data() + size(); }
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
  friend std::strong_ordering operator<=>(const ByteBuffer& left, const ByteBuffer& right) {
    return left.characters() <=> right.characters();
  }
  // With whatever a ByteView is made of, of which no copy is made.
  template <internal::OtherBytes Bytes>
  friend bool operator==(const ByteBuffer& left, Bytes&& right) {
    return left.characters() == ByteView(right).characters();
  }
  void hash(Hasher& into) const { into.combine(characters()); }

  // In hexadecimal digits: "3b1f54c0".
  friend std::ostream& operator<<(std::ostream& out, const ByteBuffer& buffer);

 private:
  friend internal::FieldReader;
  friend internal::FieldWriter;

  internal::InlineBytes bytes_;
};

}  // namespace orv

template <>
struct std::hash<orv::ByteBuffer> : orv::internal::StandardHash<orv::ByteBuffer> {};

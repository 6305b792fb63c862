// A Unicode string.
#pragma once

#include <compare>
#include <concepts>
#include <cstddef>
#include <expected>
#include <functional>
#include <iosfwd>
#include <string>
#include <string_view>

#include <orv/hasher.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

class Text;

namespace internal {
class FieldReader;
class FieldWriter;

template <class S>
concept OtherText = !std::same_as<S, Text> && std::convertible_to<const S&, std::string_view>;
template <class S>
concept Utf8String = std::convertible_to<const S&, std::u8string_view>;
template <class S>
concept TextSource = OtherText<S> || Utf8String<S>;
}  // namespace internal

// Why a text could not be made: where the first ill-formed byte stands.
struct IllFormedText {
  std::size_t offset;

  // "ill-formed UTF-8 at byte 3"
  std::string message() const;

  friend bool operator==(const IllFormedText&, const IllFormedText&) = default;
  friend std::ostream& operator<<(std::ostream& out, const IllFormedText& error);
};

// A Unicode string, always well-formed UTF-8. Two texts are equal when they are canonically equivalent
// (Unicode 15.0, D70), even if their bytes differ: "é" as one code point equals "e" with a combining accent.
// Equal texts hash alike, and none of them comes before the other: texts are ordered by the code points of
// their canonical decompositions.
class Text {
 public:
  constexpr Text() noexcept = default;

  // Takes any bytes: each maximal ill-formed part becomes U+FFFD, as Unicode 15.0 recommends in section 3.9.
  Text(std::string_view utf8);  // NOLINT(google-explicit-constructor): a text may be written as a literal
  template <internal::OtherText String>
  Text(const String& utf8)  // NOLINT(google-explicit-constructor)
      : Text(static_cast<std::string_view>(utf8)) {}
  template <internal::Utf8String String>
  Text(const String& utf8)  // NOLINT(google-explicit-constructor)
      : Text(charactersOf(utf8)) {}

  // Takes well-formed bytes only; the error says where the first ill-formed part begins.
  [[nodiscard]] static std::expected<Text, IllFormedText> checked(std::string_view utf8);

  // The UTF-8 bytes as they were given. The view is valid until the text is changed or destroyed.
  std::string_view utf8() const ORV_BOUND { return bytes_.view(); }
  operator std::string_view() const ORV_BOUND { return utf8(); }  // NOLINT(google-explicit-constructor)
  std::size_t sizeInBytes() const { return bytes_.size(); }
  std::size_t size() const { return sizeInBytes(); }
  bool isEmpty() const { return sizeInBytes() == 0; }
  bool empty() const { return isEmpty(); }

  void append(const Text& other) { bytes_.append(other.utf8()); }
  Text& operator+=(const Text& other) {
    append(other);
    return *this;
  }
  friend Text operator+(Text left, const Text& right) {
    left.append(right);
    return left;
  }

  friend bool operator==(const Text& left, const Text& right) {
    return left.bytes_ == right.bytes_ || canonicalOrder(left.utf8(), right.utf8()) == 0;
  }
  friend std::weak_ordering operator<=>(const Text& left, const Text& right) {
    return canonicalOrder(left.utf8(), right.utf8());
  }
  // With what a text is made of.
  template <internal::TextSource String>
  friend bool operator==(const Text& left, const String& right) {
    return left == Text(right);
  }
  template <internal::TextSource String>
  friend std::weak_ordering operator<=>(const Text& left, const String& right) {
    return left <=> Text(right);
  }
  void hash(Hasher& into) const;

  // As it is.
  friend std::ostream& operator<<(std::ostream& out, const Text& text);

 private:
  friend internal::FieldReader;
  friend internal::FieldWriter;

  static std::weak_ordering canonicalOrder(std::string_view left, std::string_view right);
  static std::string_view charactersOf(std::u8string_view utf8) {
    return {reinterpret_cast<const char*>(utf8.data()), utf8.size()};
  }

  internal::InlineBytes bytes_;
};

}  // namespace orv

template <>
struct std::hash<orv::Text> : orv::internal::StandardHash<orv::Text> {};

template <>
class std::bad_expected_access<orv::IllFormedText> : public orv::internal::BadAccess<orv::IllFormedText> {
  using BadAccess::BadAccess;
};

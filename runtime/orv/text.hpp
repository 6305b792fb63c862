// A Unicode string.
#pragma once

#include <cstddef>
#include <expected>
#include <functional>
#include <string>
#include <string_view>

#include <orv/hasher.hpp>
#include <orv/internal/inline_bytes.hpp>

namespace orv::inline v0 {

namespace internal {
class FieldReader;
class FieldWriter;
}  // namespace internal

// Why a text could not be made: where the first ill-formed byte stands.
struct IllFormedText {
  std::size_t offset;

  friend bool operator==(const IllFormedText&, const IllFormedText&) = default;
};

// A Unicode string, always well-formed UTF-8. Two texts are equal when they are canonically equivalent
// (Unicode 15.0, D70), even if their bytes differ: "é" as one code point equals "e" with a combining accent.
// Equal texts hash alike.
class Text {
 public:
  constexpr Text() noexcept = default;

  // Takes any bytes: each maximal ill-formed part becomes U+FFFD, as Unicode 15.0 recommends in section 3.9.
  Text(std::string_view utf8);  // NOLINT(google-explicit-constructor): a text may be written as a literal
  Text(const char* utf8) : Text(std::string_view(utf8)) {}         // NOLINT(google-explicit-constructor)
  Text(const std::string& utf8) : Text(std::string_view(utf8)) {}  // NOLINT(google-explicit-constructor)

  // Takes well-formed bytes only; the error says where the first ill-formed part begins.
  [[nodiscard]] static std::expected<Text, IllFormedText> checked(std::string_view utf8);

  // The UTF-8 bytes as they were given. The view is valid until the text is changed or
  // destroyed.
  std::string_view utf8() const { return bytes_.view(); }
  std::size_t sizeInBytes() const { return bytes_.size(); }
  bool isEmpty() const { return sizeInBytes() == 0; }

  void append(const Text& other) { bytes_.append(other.utf8()); }
  Text& operator+=(const Text& other) {
    append(other);
    return *this;
  }

  friend bool operator==(const Text& left, const Text& right) {
    return left.bytes_ == right.bytes_ || isCanonicallyEqual(left.utf8(), right.utf8());
  }
  void hash(Hasher& into) const;

 private:
  friend internal::FieldReader;
  friend internal::FieldWriter;

  static bool isCanonicallyEqual(std::string_view left, std::string_view right);

  internal::InlineBytes bytes_;
};

}  // namespace orv

template <>
struct std::hash<orv::Text> : orv::internal::StandardHash<orv::Text> {};

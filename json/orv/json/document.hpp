// A parsed JSON document, whose interface shows nothing of the library that parses it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <memory>
#include <optional>
#include <string_view>

#include <orv/decode_limits.hpp>
#include <orv/internal/standard.hpp>
#include <orv/json/error.hpp>

namespace orv::inline v0::json {

// A view of one value of a document, valid as long as the document.
class Value {
 public:
  enum class Kind : std::uint8_t { null, boolean, number, text, list, object };

  struct Member;

  Kind kind() const;
  // "a number", "null" and so on, for messages.
  std::string_view kindName() const;

  // Each is for values of one kind, which it asserts.
  bool boolean() const;
  std::string_view text() const;
  // None for a number with a fraction or beyond 64 bits; 5, 5.0 and 50e-1 are the same integer.
  std::optional<std::int64_t> integer() const;

  // The items of a list and the members of an object, in the document's order; asserts the kind.
  std::size_t size() const;
  Value item(std::size_t index) const;
  Member member(std::size_t index) const;
  // None if the object has no such member. Takes time in proportion to the number of members.
  std::optional<Value> find(std::string_view name) const;

 private:
  friend class Document;
  explicit Value(const void* node) : node_(node) {}

  const void* node_;
};

// A member of an object. Both are valid as long as the document.
struct Value::Member {
  std::string_view name;
  Value value;
};

// Owns the values.
class Document {
 public:
  // Values nested more deeply are refused.
  static constexpr std::size_t maximumNesting = 100;

  // Takes a text that is one JSON value, whose objects have no two members of one name. Of the limits, each value
  // counts as an element: it takes memory before anybody knows whether it belongs to a list of the message.
  [[nodiscard]] static std::expected<Document, Error> parse(
      std::string_view text, const DecodeLimits& limits = DecodeLimits::none());

  Document(Document&&) noexcept;
  Document& operator=(Document&&) noexcept;
  ~Document();

  Value root() const ORV_BOUND;

 private:
  struct Contents;
  explicit Document(std::unique_ptr<Contents> contents);

  std::unique_ptr<Contents> contents_;
};

}  // namespace orv::json

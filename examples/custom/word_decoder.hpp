// A decoder of its own: it reads messages from words.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>

namespace words {

// "handle=anna@tablet" is a field with a value, "member{" begins a nested message and "}" ends it:
//
//   memberAdded{ groupUUID=0123 member{ handle=anna@tablet } }
//
// Fields go by their text names. A value holds no spaces. The error is a sentence.
class WordDecoder {
 public:
  using Error = std::string;
  using Result = std::expected<void, Error>;

  explicit WordDecoder(std::string_view words) : words_(words) {}

  // A name that the message does not know is an error here, so nothing is ever left to the unknown fields.
  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M&) {
    const std::string_view word = takeWord();
    if (word.empty() || word == "}") return std::nullopt;
    const std::size_t end = word.find_first_of("={");
    const std::string_view name = word.substr(0, end);
    value_ = end == std::string_view::npos ? std::string_view() : word.substr(end + 1);
    const auto number = M::_protobuf_nameMap().number(name);
    if (!number) return std::unexpected(std::string(M::protoMessageName) + " has no " + std::string(name));
    return static_cast<std::uint32_t>(*number);
  }

  // Each of these serves both forms: a plain value and a std::optional are assigned alike.
  template <class Slot>
  Result decodeSingularStringField(Slot& slot) {
    slot = orv::Text(value_);
    return {};
  }
  template <class Slot>
  Result decodeSingularBytesField(Slot& slot) {
    slot = orv::ByteBuffer(value_);
    return {};
  }
  template <class Slot>
  Result decodeSingularBoolField(Slot& slot) {
    if (value_ != "true" && value_ != "false") return std::unexpected(std::string(value_) + " is no bool");
    slot = value_ == "true";
    return {};
  }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>&) { return noNumbers(); }
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>&) {
    return noNumbers();
  }
  Result decodeRepeatedStringField(std::vector<orv::Text>& texts) {
    texts.emplace_back(value_);
    return {};
  }

  // A nested message is read by its own rules, from the words that follow.
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    M message = slot.value_or(M{});
    auto read = message.decodeMessage(*this);
    if (read) slot = std::move(message);
    return read;
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    M message;
    auto read = message.decodeMessage(*this);
    if (read) messages.push_back(std::move(message));
    return read;
  }

  Result handleConflictingOneOf() { return {}; }

 private:
  static Result noNumbers() { return std::unexpected("numbers cannot be written in words"); }

  std::string_view takeWord() {
    words_.remove_prefix(std::min(words_.find_first_not_of(' '), words_.size()));
    const std::string_view word = words_.substr(0, words_.find(' '));
    words_.remove_prefix(word.size());
    return word;
  }

  std::string_view words_;
  std::string_view value_;  // of the field whose number was given last
};

}  // namespace words

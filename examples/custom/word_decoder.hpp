// A decoder of its own: it reads messages from words.
#pragma once

#include <algorithm>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <string>
#include <string_view>

#include <orv/any_value_decoder.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>

namespace words {

// "handle=anna@tablet" is a field with a value, "member{" begins a nested message and "}" ends it:
//
//   memberAdded{ groupUUID=0123 member{ handle=anna@tablet } }
//
// Fields go by their text names. A value holds no spaces. The error is a sentence.
class WordDecoder : public orv::AnyValueDecoder<WordDecoder, std::string> {
 public:
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

  // The base asks for a value of each kind of field, and stores it.
  template <class T>
  std::expected<bool, Error> readAnyValue(T& value) {
    if constexpr (std::same_as<T, orv::Text> || std::same_as<T, orv::ByteBuffer>) {
      value = value_;
      return true;
    } else if constexpr (std::same_as<T, bool>) {
      value = value_ == "true";
      if (value || value_ == "false") return true;
      return std::unexpected(std::string(value_) + " is no bool");
    }
    return std::unexpected("numbers cannot be written in words");
  }
  // A nested message is read by its own rules, from the words that follow.
  template <class M>
  std::expected<bool, Error> readAnyMessage(M& message) {
    if (auto read = message.decodeMessage(*this); !read) return std::unexpected(read.error());
    return true;
  }

 private:
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

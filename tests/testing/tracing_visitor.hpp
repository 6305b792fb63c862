// A visitor that is not the library's: it notes what it is handed, and stops when told to.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <memory>
#include <string>
#include <vector>

#include <orv/visitor.hpp>
#include "tests/testing/hex.hpp"

namespace orv::test {

class TracingVisitor {
 public:
  using Error = std::shared_ptr<const int>;
  using Result = std::expected<void, Error>;

  // Answers the error at that visit, or throws it.
  explicit TracingVisitor(std::size_t failingVisit = SIZE_MAX, Error error = nullptr, bool throws = false)
      : failingVisit_(failingVisit), error_(std::move(error)), throws_(throws) {}

  const std::vector<std::string>& visits() const { return visits_; }

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    return note(number, "string " + std::string(value.utf8()));
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return note(number, "bytes " + toHex(value.characters()));
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    return note(number, value ? "bool true" : "bool false");
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return note(number, "uint32 " + std::to_string(value));
  }
  template <class E>
  Result visitSingularEnumField(const E& value, std::uint32_t number) {
    return note(number, "enum " + std::to_string(value.rawValue()));
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    if (auto noted = note(number, "message " + std::string(M::protoMessageName)); !noted) return noted;
    return message.traverse(*this);
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    return note(number, std::to_string(texts.size()) + " strings");
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    if (auto noted = note(number, std::to_string(messages.size()) + " messages"); !noted) return noted;
    for (const M& message : messages) {
      if (auto walked = message.traverse(*this); !walked) return walked;
    }
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields) {
    const auto records = unknownFields.records();
    return note(0, "unknown " + toHex({reinterpret_cast<const char*>(records.data()), records.size()}));
  }

 private:
  Result note(std::uint32_t number, const std::string& what) {
    if (visits_.size() == failingVisit_) {
#ifdef __cpp_exceptions
      if (throws_) throw error_;
#endif
      return std::unexpected(error_);
    }
    visits_.push_back(std::to_string(number) + " " + what);
    return {};
  }

  std::vector<std::string> visits_;
  std::size_t failingVisit_;
  Error error_;
  [[maybe_unused]] bool throws_;  // unused where there are no exceptions
};

static_assert(Visitor<TracingVisitor>);

}  // namespace orv::test

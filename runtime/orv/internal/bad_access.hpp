// What std::expected::value() throws where there is no value.
#pragma once

#include <expected>
#include <stdexcept>
#include <string>
#include <utility>

namespace orv::inline v0::internal {

// A std::bad_expected_access whose what() says what was wrong, as the error itself does. An error type has it
// by a specialisation, which the standard library allows for a program's own types:
//
//   template <>
//   class std::bad_expected_access<E> : public orv::internal::BadAccess<E> {
//     using BadAccess::BadAccess;
//   };
template <class E>
class BadAccess : public std::bad_expected_access<void> {
 public:
  explicit BadAccess(E error) : error_(std::move(error)), text_(textOf(error_)) {}

  const char* what() const noexcept override { return text_.what(); }
  E& error() & noexcept { return error_; }
  const E& error() const& noexcept { return error_; }
  E&& error() && noexcept { return std::move(error_); }
  const E&& error() const&& noexcept { return std::move(error_); }

 private:
  static std::string textOf(const E& error) {
    if constexpr (requires { error.message(); })
      return error.message();
    else
      return std::string(describe(error));
  }

  E error_;
  std::runtime_error text_;  // copied without an exception
};

}  // namespace orv::internal

// What compilers and the standard library must be able to do, what only some can, and what is added to them.
#pragma once

// Messages, texts and bytes reach this header before the others: what cannot compile them says so here, and stops at
// a file that is not there, in place of hundreds of errors.
#if __has_include(<version>)
#include <version>
#endif
#ifndef __cpp_lib_expected
#error "orv needs C++23: g++ 12 or clang 19, or newer, with -std=c++23"
#include "orv needs C++23"
#endif

#include <expected>
#include <stdexcept>
#include <string>
#include <utility>

// Behind that of which a function's result is a view: clang warns where it is a temporary that the view outlives.
#ifdef __clang__
#define ORV_BOUND [[clang::lifetimebound]]
#else
#define ORV_BOUND
#endif

namespace orv::inline v0::internal {

// What std::expected::value() throws where there is no value: a std::bad_expected_access whose what() says what was
// wrong, as the error itself does. An error type has it by a specialisation, which the standard library allows for a
// program's own types:
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

// Why a JSON text is no message.
#pragma once

#include <cstddef>
#include <expected>
#include <iosfwd>
#include <string>
#include <string_view>

#include <orv/internal/printing.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0::json {

// The error of everything that reads JSON.
struct Error {
  // What is wrong, without a full stop: "unknown field (did you mean \"handle\"?)".
  std::string reason;
  // Which value it is about: "$.initialize.members[1].hndle". Empty for a text that is no JSON.
  std::string path;
  // Where such a text goes wrong, both counted from 1, the column in characters; 0 when there is a path.
  std::size_t line = 0;
  std::size_t column = 0;

  // All of it in one line: "$.version: expected a number, found a string", "line 3, column 7: syntax error
  // …".
  std::string message() const;

  friend bool operator==(const Error&, const Error&) = default;
  friend std::ostream& operator<<(std::ostream& out, const Error& error) {
    return internal::print(out, error.message());
  }
};

// A step into an object, as paths write it: ".name", or ["na me"] for what is no plain word. Long names are
// cut short.
std::string memberStep(std::string_view name);

}  // namespace orv::json

template <>
class std::bad_expected_access<orv::json::Error> : public orv::internal::BadAccess<orv::json::Error> {
  using BadAccess::BadAccess;
};

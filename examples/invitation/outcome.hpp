// What a step of the invitation answers.
#pragma once

#include <expected>
#include <string>
#include <utility>

namespace invitation {

// What went wrong, as one line for people.
struct Failure {
  std::string message;
  bool isTimeout = false;  // nothing came until the deadline
};

template <class T = void>
using Outcome = std::expected<T, Failure>;

inline std::unexpected<Failure> failure(std::string message) {
  return std::unexpected(Failure{std::move(message)});
}

}  // namespace invitation

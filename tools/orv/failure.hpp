// How the command ends, and why.
#pragma once

#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <expected>
#include <string>
#include <string_view>

#include <orv/spelling/value_text.hpp>

namespace orv::tool {

enum class ExitStatus : std::uint8_t {
  done = 0,       // also: equal
  different = 1,  // only from diff
  usage = 2,
  malformed = 3,  // input that is no message
  fileError = 4,  // a file that cannot be read or written
};

// How much of the input is lost by a failure: what is nested in a message, a message, or all that follows.
enum class Extent : std::uint8_t { part, message, rest };

// Why something could not be done: a status, and the one line that says it.
struct Failure {
  ExitStatus status;
  std::string line;
  Extent extent = Extent::rest;
  std::string reason{};  // the line's end, behind file and message, where there is a message
};

template <class T>
using Outcome = std::expected<T, Failure>;

inline std::unexpected<Failure> fail(ExitStatus status, std::string line) {
  return std::unexpected(Failure{status, std::move(line)});
}

// The reader of the output has gone, which is no error: the work ends at once, without a line.
inline std::unexpected<Failure> endQuietly() { return fail(ExitStatus::done, {}); }

// "file: reason", with what errno says.
inline std::unexpected<Failure> failWithErrno(std::string_view file) {
  const int cause = errno;
  return fail(ExitStatus::fileError, std::string(file) + ": " + std::strerror(cause));
}

// Prints the failure's line, if it has any, on standard error. What file names and input bring into it is
// escaped, so that it is one line and leaves the terminal alone.
inline void report(const Failure& failure) {
  if (failure.line.empty()) return;
  const std::string line = spelling::printable(failure.line) + '\n';
  // Nothing can be done where this fails too.
  [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
}

}  // namespace orv::tool

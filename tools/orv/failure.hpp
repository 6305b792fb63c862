// How the command ends, and why.
#pragma once

#include <cstdint>
#include <expected>
#include <string>
#include <string_view>

namespace orv::tool {

enum class ExitStatus : std::uint8_t {
  done = 0,       // also: equal
  different = 1,  // only from diff
  usage = 2,
  malformed = 3,  // input that is no message
  fileError = 4,  // a file that cannot be read or written
};

// What ends the work on a file, or all of it: a status, and the one line that says why.
struct Failure {
  ExitStatus status;
  std::string line;
};

template <class T>
using Outcome = std::expected<T, Failure>;

inline std::unexpected<Failure> fail(ExitStatus status, std::string line) {
  return std::unexpected(Failure{status, std::move(line)});
}

// The reader of the output has gone, which is no error: the work ends at once, without a line.
inline std::unexpected<Failure> endQuietly() { return fail(ExitStatus::done, {}); }

// "file: reason", with what errno says.
std::unexpected<Failure> failWithErrno(std::string_view file);

// Prints the failure's line, if it has any, on standard error. Control characters and ill-formed text in it,
// which come from file names and from input, are made visible, so that it is one line and leaves the terminal
// alone.
void report(const Failure& failure);

}  // namespace orv::tool

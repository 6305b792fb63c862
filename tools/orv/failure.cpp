#include "tools/orv/failure.hpp"

#include <unistd.h>

#include <cerrno>
#include <cstring>

#include <orv/spelling/value_text.hpp>

namespace orv::tool {

std::unexpected<Failure> failWithErrno(std::string_view file) {
  const int cause = errno;
  return fail(ExitStatus::fileError, std::string(file) + ": " + std::strerror(cause));
}

void report(const Failure& failure) {
  if (failure.line.empty()) return;
  const std::string line = spelling::printable(failure.line) + '\n';
  // Nothing can be done where this fails too.
  [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
}

}  // namespace orv::tool

#include "tools/orv/failure.hpp"

#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstring>

#include <orv/utf8.hpp>

namespace orv::tool {

namespace {

std::string printable(std::string_view text) {
  std::string output;
  while (!text.empty()) {
    const utf8::Step step = utf8::step(text);
    const bool isControl = step.codePoint < 0x20 || (step.codePoint >= 0x7F && step.codePoint < 0xA0);
    if (step.isWellFormed && !isControl) {
      output += text.substr(0, step.length);
    } else {
      for (const char c : text.substr(0, step.length)) {
        const auto byte = static_cast<unsigned char>(c);
        output += "\\x";
        output += "0123456789abcdef"[byte >> 4];
        output += "0123456789abcdef"[byte & 0xF];
      }
    }
    text.remove_prefix(step.length);
  }
  return output;
}

}  // namespace

std::unexpected<Failure> failWithErrno(std::string_view file) {
  const int cause = errno;
  return fail(ExitStatus::fileError, std::string(file) + ": " + std::strerror(cause));
}

void report(const Failure& failure) {
  if (failure.line.empty()) return;
  const std::string line = printable(failure.line) + '\n';
  // Nothing can be done where this fails too.
  [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
}

}  // namespace orv::tool

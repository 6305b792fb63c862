#include "tools/orv/output/progress.hpp"

#include <unistd.h>

#include <string>

#include "tools/orv/output/palette.hpp"

namespace orv::tool {

namespace {

constexpr std::chrono::milliseconds patience{1000};
constexpr std::chrono::milliseconds interval{200};

void show(const std::string& text) {
  [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, text.data(), text.size());
}

}  // namespace

Progress::Progress(bool outputIsTerminal)
    : isOn_(isTerminal(STDERR_FILENO) && !outputIsTerminal), next_(Clock::now() + patience) {}

void Progress::update(std::uint64_t messages, std::uint64_t bytes) {
  // The clock is asked now and then only.
  constexpr std::uint64_t mask = 0xFF;
  if (!isOn_ || ((messages & mask) != 0 && bytes < (mask << 20))) return;
  const Clock::time_point now = Clock::now();
  if (now < next_) return;
  next_ = now + interval;
  const std::uint64_t tenths = bytes * 10 >> 20;
  show("\r" + std::to_string(messages) + " messages, " + std::to_string(tenths / 10) + '.' +
       std::to_string(tenths % 10) + " MiB\033[K");
  isShown_ = true;
}

void Progress::clear() {
  if (!isShown_) return;
  show("\r\033[K");
  isShown_ = false;
}

}  // namespace orv::tool

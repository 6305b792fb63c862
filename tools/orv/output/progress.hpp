// Progress of long work, shown on a terminal.
#pragma once

#include <unistd.h>

#include <chrono>
#include <cstdint>
#include <string>

#include "tools/orv/output/palette.hpp"

namespace orv::tool {

// A line on standard error that is renewed from time to time once the work takes long, and goes at its end.
// Shown only when standard error is a terminal and the output is not.
class Progress {
 public:
  explicit Progress(bool outputIsTerminal)
      : isOn_(isTerminal(STDERR_FILENO) && !outputIsTerminal),
        next_(Clock::now() + std::chrono::seconds(1)) {}
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress() { clear(); }

  // So many messages, in so many bytes, are done.
  void update(std::uint64_t messages, std::uint64_t bytes) {
    // The clock is asked now and then only.
    constexpr std::uint64_t mask = 0xFF;
    if (!isOn_ || ((messages & mask) != 0 && bytes < (mask << 20))) return;
    const Clock::time_point now = Clock::now();
    if (now < next_) return;
    next_ = now + std::chrono::milliseconds(200);
    const std::uint64_t tenths = bytes * 10 >> 20;
    show("\r" + std::to_string(messages) + " messages, " + std::to_string(tenths / 10) + '.' +
         std::to_string(tenths % 10) + " MiB\033[K");
    isShown_ = true;
  }
  // Makes way for other output; the next update brings the line back.
  void clear() {
    if (isShown_) show("\r\033[K");
    isShown_ = false;
  }

 private:
  using Clock = std::chrono::steady_clock;

  static void show(const std::string& text) {
    [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, text.data(), text.size());
  }

  bool isOn_;
  bool isShown_ = false;
  Clock::time_point next_;
};

}  // namespace orv::tool

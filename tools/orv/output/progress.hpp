// Progress of long work, shown on a terminal.
#pragma once

#include <chrono>
#include <cstdint>

namespace orv::tool {

// A line on standard error that is renewed from time to time once the work takes long, and goes at its end.
// Shown only when standard error is a terminal and the output is not.
class Progress {
 public:
  explicit Progress(bool outputIsTerminal);
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress() { clear(); }

  // So many messages, in so many bytes, are done.
  void update(std::uint64_t messages, std::uint64_t bytes);
  // Makes way for other output; the next update brings the line back.
  void clear();

 private:
  using Clock = std::chrono::steady_clock;

  bool isOn_;
  bool isShown_ = false;
  Clock::time_point next_;
};

}  // namespace orv::tool

#include "tools/orv/progress.hpp"

#include <unistd.h>

#include <array>
#include <cstddef>
#include <cstdio>

#include "tools/orv/terminal.hpp"

namespace orv::tool {

namespace {

constexpr std::chrono::milliseconds patience{1000};
constexpr std::chrono::milliseconds interval{200};

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
  std::array<char, 96> line;
  const int size =
      std::snprintf(line.data(), line.size(), "\r%llu messages, %.1f MiB\033[K",
                    static_cast<unsigned long long>(messages), static_cast<double>(bytes) / 0x1p20);
  (void)!::write(STDERR_FILENO, line.data(), static_cast<std::size_t>(size));
  isShown_ = true;
}

void Progress::clear() {
  if (!isShown_) return;
  constexpr char erase[] = "\r\033[K";
  (void)!::write(STDERR_FILENO, erase, sizeof erase - 1);
  isShown_ = false;
}

}  // namespace orv::tool

#include "examples/invitation/processes.hpp"

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <utility>

namespace invitation {

Processes::~Processes() {
  for (Process& process : processes_) {
    if (process.hasEnded) continue;
    ::kill(process.id, SIGKILL);
    reap(process);
  }
}

Outcome<std::size_t> Processes::start(const std::function<int()>& work) {
  // Only the new process keeps the writing end, and nobody writes: it is closed when the process ends.
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC) != 0) return systemFailure("cannot make a pipe");
  Descriptor lifeline(ends[0]);
  const Descriptor writingEnd(ends[1]);
  const pid_t id = ::fork();
  if (id < 0) return systemFailure("cannot start a process");
  if (id == 0) std::exit(work());
  processes_.push_back({.id = id, .lifeline = std::move(lifeline)});
  return processes_.size() - 1;
}

Outcome<> Processes::awaitEnd(std::size_t index, Deadline deadline) {
  using std::chrono::milliseconds;
  while (!processes_[index].hasEnded) {
    if (!areWell()) deadline = std::min(deadline, failedAt_ + grace_);
    const auto left = std::chrono::ceil<milliseconds>(deadline - std::chrono::steady_clock::now());
    std::vector<pollfd> watched;
    watched.reserve(processes_.size());
    for (const Process& process : processes_) {
      // poll() passes over what is negative.
      watched.push_back({process.hasEnded ? -1 : process.lifeline.number(), POLLIN, 0});
    }
    const int ready = ::poll(watched.data(), watched.size(),
                             static_cast<int>(std::max(left, milliseconds::zero()).count()));
    if (ready == 0) return failure("a process did not end in time and was killed");
    if (ready < 0) return errno == EINTR ? failure("interrupted") : systemFailure("cannot wait");
    for (std::size_t at = 0; at < watched.size(); ++at) {
      if (watched[at].revents != 0) reap(processes_[at]);
    }
  }
  return {};
}

bool Processes::areWell() const { return std::ranges::all_of(processes_, &Process::isWell); }

void Processes::reap(Process& process) {
  int status = 0;
  while (::waitpid(process.id, &status, 0) < 0 && errno == EINTR) continue;
  process.hasEnded = true;
  process.isWell = WIFEXITED(status) && WEXITSTATUS(status) == 0;
  if (!process.isWell) failedAt_ = std::chrono::steady_clock::now();
}

}  // namespace invitation

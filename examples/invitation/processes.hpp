// Child processes that end with the object that holds them.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <cstddef>
#include <functional>
#include <vector>

#include "examples/invitation/outcome.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

// Processes that work together. When they go out of scope, those that still run are killed, and all are
// reaped.
class Processes {
 public:
  // Once one process has failed, the others have this long to notice.
  explicit Processes(std::chrono::milliseconds grace) : grace_(grace) {}
  ~Processes();
  Processes(const Processes&) = delete;
  Processes& operator=(const Processes&) = delete;

  // Runs `work` in a new process, which ends with the status that it returns. Answers the process's index.
  Outcome<std::size_t> start(const std::function<int()>& work);

  // Waits until this process has ended; at most until the deadline, or until the grace period
  // after a failure is over.
  Outcome<> awaitEnd(std::size_t index, Deadline deadline);

  // Whether every process that has ended did so with status 0.
  bool areWell() const;

 private:
  struct Process {
    pid_t id;
    Descriptor lifeline;  // has its other end closed once the process has ended
    bool hasEnded = false;
    bool isWell = true;
  };

  void reap(Process& process);

  std::chrono::milliseconds grace_;
  Deadline failedAt_;
  std::vector<Process> processes_;
};

}  // namespace invitation

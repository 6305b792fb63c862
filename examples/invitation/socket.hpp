// Stream sockets in the Unix domain. Every wait has a deadline.
#pragma once

#include <chrono>
#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>

#include "examples/invitation/outcome.hpp"

namespace invitation {

using Deadline = std::chrono::steady_clock::time_point;

// An open file descriptor, closed with its owner.
class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
  }
  ~Descriptor();

  int number() const { return number_; }
  bool isOpen() const { return number_ >= 0; }

 private:
  int number_ = -1;
};

// What the system says of its last error: "cannot connect: Connection refused".
std::unexpected<Failure> systemFailure(std::string_view what);

// Waits until `descriptor` is ready for any of the poll() events. Fails at the deadline and when a signal
// interrupts it.
Outcome<> waitUntilReady(const Descriptor& descriptor, int events, Deadline deadline);

// One end of a connection.
class Socket {
 public:
  explicit Socket(Descriptor descriptor) : descriptor_(std::move(descriptor)) {}

  static Outcome<Socket> connect(const std::string& path);

  // Waits for bytes and answers how many were read: 0 where the peer has closed its end.
  Outcome<std::size_t> read(std::span<std::byte> buffer, Deadline deadline);
  // As read, without waiting and without taking the bytes: none when none are there.
  Outcome<std::optional<std::size_t>> peek(std::span<std::byte> buffer) const;
  // Whether the peer has closed its end; bytes may still be there.
  bool peerHasFinished() const;
  // Writes all of them.
  Outcome<> write(std::string_view bytes, Deadline deadline);
  // What has not come until now will not be read.
  void finishReading();
  // Tells the peer that nothing more will come. Reading goes on.
  void finishWriting();

 private:
  Descriptor descriptor_;
};

// A socket that accepts connections.
class Listener {
 public:
  Listener() = default;
  // Creates the socket file, which is the caller's to remove.
  static Outcome<Listener> listenAt(const std::string& path);

  Outcome<Socket> accept(Deadline deadline);

 private:
  explicit Listener(Descriptor descriptor) : descriptor_(std::move(descriptor)) {}

  Descriptor descriptor_;
};

}  // namespace invitation

#include "examples/invitation/socket.hpp"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace invitation {

namespace {

Outcome<sockaddr_un> addressOf(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.empty() || path.size() >= sizeof address.sun_path) {
    return failure("a socket's path has 1 to " + std::to_string(sizeof address.sun_path - 1) +
                   " bytes: " + path);
  }
  std::ranges::copy(path, std::begin(address.sun_path));
  return address;
}

Descriptor newSocket() {
  return Descriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
}

// Both bind() and connect() take the general form of an address.
const sockaddr* general(const sockaddr_un& address) { return reinterpret_cast<const sockaddr*>(&address); }

}  // namespace

Descriptor::~Descriptor() {
  if (isOpen()) ::close(number_);
}

std::unexpected<Failure> systemFailure(std::string_view what) {
  const char* const reason = std::strerror(errno);
  return failure(std::string(what) + ": " + reason);
}

Outcome<> waitUntilReady(const Descriptor& descriptor, int events, Deadline deadline) {
  using std::chrono::milliseconds;
  const auto left = std::chrono::ceil<milliseconds>(deadline - std::chrono::steady_clock::now());
  pollfd watched{
      .fd = descriptor.number(), .events = static_cast<decltype(pollfd::events)>(events), .revents = 0};
  const int ready = ::poll(&watched, 1, static_cast<int>(std::max(left, milliseconds::zero()).count()));
  if (ready < 0) return errno == EINTR ? failure("interrupted") : systemFailure("cannot wait");
  if (ready == 0) return std::unexpected(Failure{"timed out", true});
  return {};
}

Outcome<Socket> Socket::connect(const std::string& path) {
  const auto address = addressOf(path);
  if (!address) return std::unexpected(address.error());
  Descriptor descriptor = newSocket();
  if (!descriptor.isOpen() || ::connect(descriptor.number(), general(*address), sizeof *address) != 0) {
    return systemFailure("cannot connect to " + path);
  }
  return Socket(std::move(descriptor));
}

Outcome<std::size_t> Socket::read(std::span<std::byte> buffer, Deadline deadline) {
  for (;;) {
    if (auto ready = waitUntilReady(descriptor_, POLLIN, deadline); !ready) {
      return std::unexpected(ready.error());
    }
    const ssize_t count = ::read(descriptor_.number(), buffer.data(), buffer.size());
    if (count >= 0) return static_cast<std::size_t>(count);
    if (errno != EAGAIN && errno != EINTR) return systemFailure("cannot read");
  }
}

Outcome<> Socket::write(std::string_view bytes, Deadline deadline) {
  while (!bytes.empty()) {
    if (auto ready = waitUntilReady(descriptor_, POLLOUT, deadline); !ready) return ready;
    const ssize_t count = ::send(descriptor_.number(), bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (count < 0 && errno != EAGAIN && errno != EINTR) return systemFailure("cannot write");
    if (count > 0) bytes.remove_prefix(static_cast<std::size_t>(count));
  }
  return {};
}

Outcome<std::optional<std::size_t>> Socket::peek(std::span<std::byte> buffer) const {
  const ssize_t count = ::recv(descriptor_.number(), buffer.data(), buffer.size(), MSG_PEEK | MSG_DONTWAIT);
  if (count >= 0) return static_cast<std::size_t>(count);
  if (errno == EAGAIN || errno == EINTR) return std::nullopt;
  return systemFailure("cannot read");
}

bool Socket::peerHasFinished() const {
  pollfd watched{.fd = descriptor_.number(), .events = POLLRDHUP, .revents = 0};
  return ::poll(&watched, 1, 0) > 0;
}

void Socket::finishReading() { ::shutdown(descriptor_.number(), SHUT_RD); }

void Socket::finishWriting() { ::shutdown(descriptor_.number(), SHUT_WR); }

Outcome<Listener> Listener::listenAt(const std::string& path) {
  constexpr int waitingConnections = 8;
  const auto address = addressOf(path);
  if (!address) return std::unexpected(address.error());
  Descriptor descriptor = newSocket();
  if (!descriptor.isOpen() || ::bind(descriptor.number(), general(*address), sizeof *address) != 0 ||
      ::listen(descriptor.number(), waitingConnections) != 0) {
    return systemFailure("cannot listen at " + path);
  }
  return Listener(std::move(descriptor));
}

Outcome<Socket> Listener::accept(Deadline deadline) {
  for (;;) {
    if (auto ready = waitUntilReady(descriptor_, POLLIN, deadline); !ready) {
      return std::unexpected(ready.error());
    }
    Descriptor accepted(::accept4(descriptor_.number(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK));
    if (accepted.isOpen()) return Socket(std::move(accepted));
    // A peer may be gone again by the time that it is accepted.
    if (errno != EAGAIN && errno != EINTR && errno != ECONNABORTED) return systemFailure("cannot accept");
  }
}

}  // namespace invitation

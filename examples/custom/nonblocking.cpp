// Messages over sockets that are never waited for: poll says when there is something to do, writev writes a
// message from where it is, and a DelimitedParser takes whatever has arrived.
#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <iostream>
#include <span>
#include <string>

#include <orv/delimited_parser.hpp>
#include <orv/delimited_writer.hpp>
#include <orv/member.hpp>

namespace {

// A part of an iovec, which points to bytes that it will not change.
iovec partOf(std::span<const std::byte> bytes) {
  return {.iov_base = const_cast<std::byte*>(bytes.data()), .iov_len = bytes.size()};
}

// All that has arrived. That nothing is there yet, or a signal came in between, is not the end.
enum class Received { more, end, failure };
Received receive(int socket, orv::DelimitedParser& parser) {
  std::array<std::byte, 16> room;  // so small that no message fits
  for (;;) {
    const ssize_t count = ::read(socket, room.data(), room.size());
    if (count == 0) return Received::end;
    if (count > 0) parser.push(std::span(room).first(static_cast<std::size_t>(count)));
    if (count < 0 && errno == EAGAIN) return Received::more;
    if (count < 0 && errno != EINTR) return Received::failure;
  }
}

}  // namespace

int main() {
  std::array<int, 2> ends{};
  if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK, 0, ends.data()) != 0) return 1;
  const auto [reading, writing] = ends;

  orv::DelimitedParser parser;
  std::array<pollfd, 2> watched{pollfd{.fd = reading, .events = POLLIN, .revents = 0},
                                pollfd{.fd = writing, .events = POLLOUT, .revents = 0}};
  std::array handles{"anna@tablet", "speaker@kitchen", "ben@phone"};
  std::size_t sent = 0;
  while (::poll(watched.data(), watched.size(), -1) >= 0 || errno == EINTR) {
    if ((watched[1].revents & POLLOUT) != 0) {
      orv::Member member;
      member.setHandle(handles.at(sent));
      const std::string body = *member.serialize();
      const orv::DelimitedHeader header(body.size());
      const std::array parts{partOf(header), partOf(std::as_bytes(std::span(body)))};
      if (::writev(writing, parts.data(), parts.size()) < 0) return 1;  // so little fits at once
      if (++sent == handles.size()) {
        ::shutdown(writing, SHUT_WR);
        watched[1].fd = -1;
      }
    }
    if ((watched[0].revents & (POLLIN | POLLHUP)) == 0) continue;
    const Received received = receive(reading, parser);
    for (auto member = parser.read<orv::Member>(); member && *member; member = parser.read<orv::Member>())
      std::cout << **member << '\n';
    if (received == Received::more) continue;
    const auto finished = parser.finish();
    std::cout << (finished ? "the end" : finished.error().message()) << '\n';
    return received == Received::end ? 0 : 1;
  }
}

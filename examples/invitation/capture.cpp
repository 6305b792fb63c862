#include "examples/invitation/capture.hpp"

#include <fcntl.h>
#include <unistd.h>

#include <string_view>

#include <orv/delimited_stream.hpp>

namespace invitation {

Outcome<Capture> Capture::create(std::string path) {
  constexpr mode_t everyoneMayRead = 0644;
  Descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, everyoneMayRead));
  if (!file.isOpen()) return systemFailure("cannot write " + path);
  return Capture(std::move(path), std::move(file));
}

Outcome<> Capture::append(const orv::SessionMessage& message) {
  std::string record;
  if (auto appended = orv::appendDelimited(message, record); !appended) {
    return failure(std::string(describe(appended.error())));
  }
  for (std::string_view left = record; !left.empty();) {
    const ssize_t count = ::write(file_.number(), left.data(), left.size());
    if (count < 0) return systemFailure("cannot write " + path_);
    left.remove_prefix(static_cast<std::size_t>(count));
  }
  ++size_;
  return {};
}

}  // namespace invitation

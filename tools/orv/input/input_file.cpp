#include "tools/orv/input/input_file.hpp"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include <orv/byte_view.hpp>

namespace orv::tool {

Outcome<InputFile> InputFile::open(const std::string& path) {
  if (path == "-") return InputFile("standard input", STDIN_FILENO);
  const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return failWithErrno(path);
  return InputFile(path, descriptor);
}

InputFile::InputFile(InputFile&& other) noexcept
    : name_(std::move(other.name_)),
      descriptor_(std::exchange(other.descriptor_, STDIN_FILENO)),
      lookedAt_(std::move(other.lookedAt_)) {}

InputFile::~InputFile() {
  if (descriptor_ != STDIN_FILENO) ::close(descriptor_);
}

std::ptrdiff_t InputFile::read(std::span<std::byte> buffer) {
  if (lookedAt_.empty()) return readDescriptor(buffer);
  const std::size_t count = std::min(buffer.size(), lookedAt_.size());
  std::memcpy(buffer.data(), lookedAt_.data(), count);
  lookedAt_.erase(0, count);
  return static_cast<std::ptrdiff_t>(count);
}

std::optional<char> InputFile::firstVisibleCharacter() {
  constexpr std::size_t limit = std::size_t{64} << 10;
  for (;;) {
    const auto at = lookedAt_.find_first_not_of(" \t\r\n");
    if (at != std::string::npos) return lookedAt_[at];
    std::byte piece[4096];
    const std::ptrdiff_t count = lookedAt_.size() < limit ? readDescriptor(piece) : 0;
    // A failure shows again when the input is read.
    if (count <= 0) return std::nullopt;
    lookedAt_.append(charactersOf(std::span(piece).first(static_cast<std::size_t>(count))));
  }
}

std::ptrdiff_t InputFile::readDescriptor(std::span<std::byte> buffer) const {
  for (;;) {
    const ssize_t count = ::read(descriptor_, buffer.data(), buffer.size());
    if (count >= 0 || errno != EINTR) return count;
  }
}

}  // namespace orv::tool

#include "tools/orv/input/input_file.hpp"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include <orv/byte_view.hpp>

namespace orv::tool {

Outcome<InputFile> InputFile::open(const std::string& path, OutputFile& output) {
  if (path == "-") return InputFile("standard input", STDIN_FILENO, output);
  const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return failWithErrno(path);
  return InputFile(path, descriptor, output);
}

InputFile::InputFile(InputFile&& other) noexcept
    : name_(std::move(other.name_)),
      descriptor_(std::exchange(other.descriptor_, STDIN_FILENO)),
      output_(other.output_),
      failure_(std::move(other.failure_)),
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

std::string_view InputFile::beginning() {
  constexpr std::size_t limit = std::size_t{64} << 10;
  while (lookedAt_.find_first_not_of(" \t\r\n") == std::string::npos && lookedAt_.size() < limit) {
    std::byte piece[4096];
    const std::ptrdiff_t count = readDescriptor(piece);
    // A failure shows again when the input is read.
    if (count <= 0) break;
    lookedAt_.append(charactersOf(std::span(piece).first(static_cast<std::size_t>(count))));
  }
  return lookedAt_;
}

void InputFile::skipByteOrderMark() {
  if (beginning().starts_with(byteOrderMark)) lookedAt_.erase(0, byteOrderMark.size());
}

std::ptrdiff_t InputFile::readDescriptor(std::span<std::byte> buffer) {
  pollfd source{.fd = descriptor_, .events = POLLIN, .revents = 0};
  if (::poll(&source, 1, 0) == 0) {
    if (auto written = output_.flush(); !written) {
      failure_ = std::move(written.error());
      return -1;
    }
  }
  for (;;) {
    const ssize_t count = ::read(descriptor_, buffer.data(), buffer.size());
    if (count >= 0) return count;
    if (errno == EINTR) continue;
    failure_ = failWithErrno(name_).error();
    return -1;
  }
}

spelling::TextError redacted(spelling::TextError error, const Options& options) {
  if (options.hidesSecrets) error.reason = "malformed, <redacted>";
  return error;
}

ByteSource::ByteSource(InputFile& file, Format format, const Options& options)
    : file_(file), options_(options) {
  using Runs = spelling::Base64Reader::Runs;
  if (format == Format::hex) spelling_.emplace<spelling::HexReader>();
  if (format == Format::base64)
    spelling_.emplace<spelling::Base64Reader>(options.isDelimited ? Runs::several : Runs::one);
}

std::ptrdiff_t ByteSource::read(std::span<std::byte> buffer) {
  if (!std::holds_alternative<std::monostate>(spelling_)) return readSpelled(buffer);
  const std::ptrdiff_t count = file_.read(buffer);
  if (count < 0) failure_ = file_.failure();
  return count;
}

std::ptrdiff_t ByteSource::readSpelled(std::span<std::byte> buffer) {
  while (taken_ == pending_.size() && !isAtEnd_) {
    pending_.clear();
    taken_ = 0;
    std::byte piece[16384];
    const std::ptrdiff_t count = file_.read(piece);
    isAtEnd_ = count <= 0;
    if (count < 0) {
      failure_ = file_.failure();
      continue;
    }
    const std::string_view characters = charactersOf(std::span(piece).first(static_cast<std::size_t>(count)));
    if (const auto done = spell(characters); !done) {
      isAtEnd_ = true;
      failure_ =
          Failure{ExitStatus::malformed, file_.name() + ": " + redacted(done.error(), options_).message()};
    }
  }
  // What stands before an error is handed out before it shows.
  if (taken_ == pending_.size() && failure_.has_value()) return -1;
  const std::size_t count = std::min(buffer.size(), pending_.size() - taken_);
  std::memcpy(buffer.data(), pending_.data() + taken_, count);
  taken_ += count;
  return static_cast<std::ptrdiff_t>(count);
}

std::expected<void, spelling::TextError> ByteSource::spell(std::string_view piece) {
  const auto read = [&](auto& reader) {
    return piece.empty() ? reader.finish(pending_) : reader.take(piece, pending_);
  };
  if (auto* const hex = std::get_if<spelling::HexReader>(&spelling_)) return read(*hex);
  return read(std::get<spelling::Base64Reader>(spelling_));
}

}  // namespace orv::tool

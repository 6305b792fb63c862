#include "tools/orv/byte_source.hpp"

#include <algorithm>
#include <cstring>

namespace orv::tool {

ByteSource::ByteSource(InputFile& file, Format format) : file_(file) {
  if (format == Format::hex) spelling_.emplace<HexReader>();
  if (format == Format::base64) spelling_.emplace<Base64Reader>();
}

std::ptrdiff_t ByteSource::read(std::span<std::byte> buffer) {
  if (!std::holds_alternative<std::monostate>(spelling_)) return readSpelled(buffer);
  const std::ptrdiff_t count = file_.read(buffer);
  if (count < 0) failure_ = failWithErrno(file_.name()).error();
  return count;
}

std::ptrdiff_t ByteSource::readSpelled(std::span<std::byte> buffer) {
  while (taken_ == pending_.size() && !isAtEnd_) {
    pending_.clear();
    taken_ = 0;
    char piece[16384];
    const std::ptrdiff_t count = file_.read(std::as_writable_bytes(std::span(piece)));
    isAtEnd_ = count <= 0;
    if (count < 0) {
      failure_ = failWithErrno(file_.name()).error();
    } else if (auto done = count == 0 ? finish() : take({piece, static_cast<std::size_t>(count)}); !done) {
      const SpellingFault& fault = done.error();
      isAtEnd_ = true;
      failure_ =
          Failure{ExitStatus::malformed, file_.name() + ": line " + std::to_string(fault.line) + ", column " +
                                             std::to_string(fault.column) + ": " + fault.reason};
    }
  }
  // What stands before a fault is handed out before it shows.
  if (taken_ == pending_.size() && failure_.has_value()) return -1;
  const std::size_t count = std::min(buffer.size(), pending_.size() - taken_);
  std::memcpy(buffer.data(), pending_.data() + taken_, count);
  taken_ += count;
  return static_cast<std::ptrdiff_t>(count);
}

std::expected<void, SpellingFault> ByteSource::take(std::string_view piece) {
  if (auto* const hex = std::get_if<HexReader>(&spelling_)) return hex->take(piece, pending_);
  return std::get<Base64Reader>(spelling_).take(piece, pending_);
}

std::expected<void, SpellingFault> ByteSource::finish() {
  if (const auto* const hex = std::get_if<HexReader>(&spelling_)) return hex->finish();
  return std::get<Base64Reader>(spelling_).finish(pending_);
}

}  // namespace orv::tool

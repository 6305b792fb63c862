#include "tools/orv/input/byte_source.hpp"

#include <algorithm>
#include <cstring>

#include <orv/byte_view.hpp>

namespace orv::tool {

ByteSource::ByteSource(InputFile& file, Format format) : file_(file) {
  if (format == Format::hex) spelling_.emplace<spelling::HexReader>();
  if (format == Format::base64) spelling_.emplace<spelling::Base64Reader>();
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
    std::byte piece[16384];
    const std::ptrdiff_t count = file_.read(piece);
    isAtEnd_ = count <= 0;
    if (count < 0) {
      failure_ = failWithErrno(file_.name()).error();
      continue;
    }
    const std::string_view characters = charactersOf(std::span(piece).first(static_cast<std::size_t>(count)));
    if (const auto done = spell(characters); !done) {
      isAtEnd_ = true;
      failure_ = Failure{ExitStatus::malformed, file_.name() + ": " + done.error().message()};
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

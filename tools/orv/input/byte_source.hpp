// Input as bytes, however it spells them.
#pragma once

#include <cstddef>
#include <expected>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include <orv/spelling/base64.hpp>
#include <orv/spelling/hex.hpp>
#include "tools/orv/failure.hpp"
#include "tools/orv/input/input_file.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// Reads a file in one of the formats that spell bytes.
class ByteSource {
 public:
  // The file must outlive the source.
  ByteSource(InputFile& file, Format format);

  // As InputFile::read; after a negative answer failure() says what was wrong.
  std::ptrdiff_t read(std::span<std::byte> buffer);
  const Failure& failure() const { return *failure_; }

 private:
  std::ptrdiff_t readSpelled(std::span<std::byte> buffer);
  // An empty piece is the end.
  std::expected<void, spelling::TextError> spell(std::string_view piece);

  InputFile& file_;
  std::variant<std::monostate, spelling::HexReader, spelling::Base64Reader> spelling_;
  std::string pending_;  // bytes that were read and not yet handed out, from taken_ on
  std::size_t taken_ = 0;
  bool isAtEnd_ = false;
  std::optional<Failure> failure_;
};

}  // namespace orv::tool

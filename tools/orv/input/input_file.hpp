// Where input comes from: files, and their bytes however they spell them.
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
#include "tools/orv/options.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {

// What some editors put before UTF-8.
inline constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";

// The error, without what its reason quotes of the text where secrets are to be hidden.
spelling::TextError redacted(spelling::TextError error, const Options& options);

// A file, or standard input for "-", read from its beginning to its end. Whenever more of it is waited for, what
// was made of it so far is written.
class InputFile {
 public:
  // The output must outlive the file.
  [[nodiscard]] static Outcome<InputFile> open(const std::string& path, OutputFile& output);

  InputFile(InputFile&& other) noexcept;
  InputFile& operator=(InputFile&&) = delete;
  ~InputFile();

  // As errors name it.
  const std::string& name() const { return name_; }

  // Answers how many bytes it put into the buffer, 0 at the end, and a negative number after a failure.
  std::ptrdiff_t read(std::span<std::byte> buffer);
  const Failure& failure() const { return *failure_; }

  // What it begins with, white space and more, which stays to be read. Only white space if there is much of it.
  std::string_view beginning();
  // Leaves out a byte order mark that it begins with.
  void skipByteOrderMark();

 private:
  InputFile(std::string name, int descriptor, OutputFile& output)
      : name_(std::move(name)), descriptor_(descriptor), output_(output) {}
  std::ptrdiff_t readDescriptor(std::span<std::byte> buffer);

  std::string name_;
  int descriptor_;
  OutputFile& output_;
  std::optional<Failure> failure_;
  std::string lookedAt_;  // what was read to look at it
};

// Reads a file in one of the formats that spell bytes.
class ByteSource {
 public:
  // The file and the options must outlive the source. In a stream padded runs of base64 follow one another.
  ByteSource(InputFile& file, Format format, const Options& options);

  // As InputFile::read; after a negative answer failure() says what was wrong.
  std::ptrdiff_t read(std::span<std::byte> buffer);
  const Failure& failure() const { return *failure_; }

 private:
  std::ptrdiff_t readSpelled(std::span<std::byte> buffer);
  // An empty piece is the end.
  std::expected<void, spelling::TextError> spell(std::string_view piece);

  InputFile& file_;
  const Options& options_;
  std::variant<std::monostate, spelling::HexReader, spelling::Base64Reader> spelling_;
  std::string pending_;  // bytes that were read and not yet handed out, from taken_ on
  std::size_t taken_ = 0;
  bool isAtEnd_ = false;
  std::optional<Failure> failure_;
};

}  // namespace orv::tool

// Where input comes from.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>

#include "tools/orv/failure.hpp"

namespace orv::tool {

// A file, or standard input for "-", read from its beginning to its end.
class InputFile {
 public:
  [[nodiscard]] static Outcome<InputFile> open(const std::string& path);

  InputFile(InputFile&& other) noexcept;
  InputFile& operator=(InputFile&&) = delete;
  ~InputFile();

  // As errors name it.
  const std::string& name() const { return name_; }

  // Answers how many bytes it put into the buffer, 0 at the end, a negative number and errno when reading
  // failed.
  std::ptrdiff_t read(std::span<std::byte> buffer);

  // The first character that is no white space, which stays to be read; none if there is none near the
  // beginning.
  std::optional<char> firstVisibleCharacter();

 private:
  InputFile(std::string name, int descriptor) : name_(std::move(name)), descriptor_(descriptor) {}
  std::ptrdiff_t readDescriptor(std::span<std::byte> buffer) const;

  std::string name_;
  int descriptor_;
  std::string lookedAt_;  // what was read to look at it
};

}  // namespace orv::tool

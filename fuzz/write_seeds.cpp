// write_seeds <directory>: writes the tests' tables as files that the fuzzers start from.
#include <filesystem>
#include <fstream>
#include <string>

#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/wire_cases.hpp"

namespace {

class SeedDirectory {
 public:
  explicit SeedDirectory(std::filesystem::path path) : path_(std::move(path)) {
    std::filesystem::create_directories(path_);
  }

  void add(std::size_t firstByte, std::string_view bytes) {
    std::ofstream file(path_ / std::to_string(count_++), std::ios::binary);
    file << static_cast<char>(firstByte) << bytes;
  }

 private:
  std::filesystem::path path_;
  int count_ = 0;
};

}  // namespace

int main(int argumentCount, char** arguments) {
  if (argumentCount != 2) return 2;
  const std::filesystem::path directory = arguments[1];
  SeedDirectory messages(directory / "messages");
  const auto& types = orv::test::allMessages();
  for (std::size_t index = 0; index < types.size(); ++index) {
    const std::string_view name = types[index]->fullName().substr(4);
    for (const auto& row : orv::test::readCases()) {
      if (row.message == name) messages.add(index, orv::test::hex(row.input));
    }
    for (const auto& row : orv::test::refusedCases()) {
      if (row.message == name) messages.add(index, orv::test::hex(row.input));
    }
    for (const auto& row : orv::test::malformedCases()) messages.add(index, orv::test::hex(row.input));
  }

  SeedDirectory texts(directory / "text");
  for (const std::string_view text :
       {"\u00E9e\u0301", "\u1F82\u03B1\u0313\u0300\u0345", "\u212BA\u030A", "\uAC01\uAC00\u11A8",
        "a\u0301\u0316a\u0316\u0301", "\xED\xA0\x80\xF4\x90\x80\x80", "K\u212A"}) {
    for (std::size_t middle = 0; middle < text.size(); ++middle) texts.add(middle, text);
  }
  return 0;
}

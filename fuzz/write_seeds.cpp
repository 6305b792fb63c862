// write_seeds <directory>: writes the tests' tables as files that the fuzzers start from, a folder for each fuzzer.
#include <filesystem>
#include <fstream>
#include <string>

#include <orv/delimited_writer.hpp>
#include <orv/json.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/nested_messages.hpp"
#include "tests/testing/wire_cases.hpp"

namespace orv::test {
namespace {

class SeedDirectory {
 public:
  explicit SeedDirectory(std::filesystem::path path) : path_(std::move(path)) {
    std::filesystem::create_directories(path_);
  }

  void add(std::string_view bytes) {
    std::ofstream(path_ / std::to_string(count_++), std::ios::binary) << bytes;
  }

 private:
  std::filesystem::path path_;
  int count_ = 0;
};

std::string byte(std::size_t value) { return std::string(1, static_cast<char>(value)); }

// All encodings written by hand that are meant for messages of this name.
std::vector<std::string> encodingsFor(std::string_view fullName) {
  std::vector<std::string> encodings;
  const std::string_view name = fullName.substr(fullName.find('.') + 1);
  for (const auto& row : readCases()) {
    if (row.message == name) encodings.push_back(hex(row.input));
  }
  for (const auto& row : refusedCases()) {
    if (row.message == name) encodings.push_back(hex(row.input));
  }
  return encodings;
}

void writeAll(const std::filesystem::path& directory) {
  SeedDirectory decode(directory / "decode"), differential(directory / "differential"),
      merge(directory / "merge"), stream(directory / "stream"), json(directory / "json"),
      equality(directory / "equality"), accessors(directory / "accessors");
  const auto& types = allMessages();
  std::string all;
  for (std::size_t index = 0; index < types.size(); ++index) {
    std::vector<std::string> encodings = encodingsFor(types[index]->fullName());
    for (const auto& row : malformedCases()) encodings.push_back(hex(row.input));
    for (const std::string& bytes : encodings) {
      decode.add(byte(index) + bytes);
      differential.add(byte(index) + bytes);
      if (bytes.size() < 200) merge.add(byte(index) + byte(bytes.size()) + bytes + bytes);
      (void)appendDelimited(bytes, all);
    }
    stream.add(byte(2) + byte(1) + byte(3) + all.substr(0, 1000));
    all.clear();
    // A value for each of the first fields and operations.
    std::string script;
    for (std::size_t step = 0; step < 24; ++step)
      script += byte(step) + byte(step % 3 + 1 + 16) + hex("0A 02 0A 00");
    accessors.add(byte(index) + script);
  }
  std::size_t index = 0;
  AllMessages::forEach([&]<class M>() {
    for (const std::string& bytes : encodingsFor(M::protoMessageName)) {
      if (const auto message = M::parse(bytes)) json.add(byte(index) + json::render(*message));
    }
    ++index;
  });
  for (const std::string_view text :
       {"\u00E9e\u0301", "\u1F82\u03B1\u0313\u0300\u0345", "\u212BA\u030A", "\uAC01\uAC00\u11A8",
        "a\u0301\u0316a\u0316\u0301", "\xED\xA0\x80\xF4\x90\x80\x80", "K\u212A"}) {
    for (std::size_t middle = 0; middle < text.size(); ++middle) {
      equality.add(byte(0) + byte(middle) + std::string(text.substr(0, middle)) + byte(1) +
                   std::string(text));
    }
  }
  equality.add(hex("01 04 00 04 05 06 04 00 05 04 06 13 12 0F 10 11"));
}

}  // namespace
}  // namespace orv::test

int main(int argumentCount, char** arguments) {
  if (argumentCount != 2) return 2;
  orv::test::writeAll(arguments[1]);
  return 0;
}

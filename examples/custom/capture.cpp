// A file of messages, each behind its length, written and read one by one, however long it is.
#include <cstdio>
#include <iostream>
#include <memory>
#include <span>
#include <string>

#include <orv/delimited_stream.hpp>
#include <orv/member.hpp>

namespace {

using File = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

orv::ReadFunction readFrom(std::FILE* file) {
  return [file](std::span<std::byte> room) -> std::ptrdiff_t {
    const std::size_t count = std::fread(room.data(), 1, room.size(), file);
    return std::ferror(file) != 0 ? -1 : static_cast<std::ptrdiff_t>(count);
  };
}

}  // namespace

int main() {
  const File file(std::tmpfile(), &std::fclose);
  if (file == nullptr) return 1;
  std::string bytes;
  for (const char* const handle : {"anna@tablet", "ben@phone", "speaker@kitchen"}) {
    orv::Member member;
    member.setHandle(handle);
    bytes.clear();
    if (!appendDelimited(member, bytes)) return 1;
    std::fwrite(bytes.data(), 1, bytes.size(), file.get());
  }
  std::fputc(5, file.get());  // and the start of one that was cut off
  std::rewind(file.get());

  orv::DelimitedReader reader(readFrom(file.get()));
  for (;;) {
    const auto member = reader.read<orv::Member>();
    if (!member) {
      std::cout << member.error() << '\n';
      return 0;
    }
    if (!member->has_value()) return 0;  // the end
    std::cout << "at " << reader.messageOffset() << ": " << **member << '\n';
  }
}

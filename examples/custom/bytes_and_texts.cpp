// Bytes come from wherever they are, and texts go together with the other strings.
#include <array>
#include <cstdint>
#include <iostream>
#include <set>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <orv/join_request.hpp>
#include <orv/member.hpp>

using namespace orv::literals;

int main() {
  // Whatever is one byte wide and in one piece is read, kept, compared and written into. `{}` is no bytes.
  const std::vector<std::uint8_t> received{0x0a, 0x02, 0x00, 0xff};
  auto request = *orv::JoinRequest::parse(received);
  request.setEncryptedData(std::span(received).last(2));
  std::cout << (request.publicKey() == request.encryptedData()) << (request.publicKey() == "\x00\xff"_bytes)
            << request.publicKey().empty() << orv::JoinRequest::parse({})->hasPublicKey() << '\n';
  for (const std::byte byte : request.publicKey()) std::cout << std::to_integer<int>(byte) << ' ';
  std::array<char, 64> buffer;
  std::cout << "written: " << *request.serializeInto(buffer) << " bytes\n";

  // A literal is whole, also with a zero in it.
  request.setPublicKey("key\0key");
  std::cout << "a key of " << request.publicKey().size() << " bytes\n";

  // "ë" is one code point here and two there, and the same text.
  orv::Member zoe;
  zoe.setHandle(u8"zo\u00EB");
  const std::string typed = "zoe\u0308";
  const std::string_view shown = zoe.handle();
  std::cout << "Hello, " + zoe.handle() + "!\n"
            << (zoe.handle() == typed) << (zoe.handle() < "zoz") << (shown == typed) << '\n';
  const std::set<orv::Text> handles{zoe.handle(), typed, "anna"};
  for (const orv::Text& handle : handles) std::cout << handle << '\n';
}

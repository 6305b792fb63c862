// A decoder that refuses a second member of a oneof. By default BinaryDecoder lets the last one win, as the
// binary format has it; a hook of one's own can be stricter.
#include <array>
#include <cstddef>
#include <cstdio>
#include <expected>
#include <string>

#include <orv/binary_decoder.hpp>
#include <orv/group.hpp>

namespace {

// 0A 00 sets `initialize`; 22 00 sets `memberLeft`, which is the same oneof.
constexpr std::array twoEvents{std::byte{0x0A}, std::byte{0x00}, std::byte{0x22}, std::byte{0x00}};

std::string eventOf(const orv::Group& group) {
  const std::string text = group.debugDescription();
  return text.substr(0, text.find(' '));
}

}  // namespace

int main() {
  const auto lastWins = orv::Group::parse(twoEvents);
  std::printf("by default the last one wins: %s\n", lastWins ? eventOf(*lastWins).c_str() : "an error");

  // The hook's error reaches the caller as it was made. The decoder refers to the hook, which must outlive
  // it.
  int conflicts = 0;
  auto refuse = [&]() -> std::expected<void, orv::DecodeError> {
    ++conflicts;
    return std::unexpected(orv::DecodeError{.cause = orv::DecodeCause::conflictingOneOf});
  };
  orv::Group group;
  orv::BinaryDecoder decoder(twoEvents, refuse);
  const auto refused = group.decodeMessage(decoder);
  if (refused) return 1;
  std::printf("a hook refuses, asked %d time: %s\n", conflicts, refused.error().reason().c_str());
  std::printf("and the group keeps what it held: %s\n", eventOf(group).c_str());
}

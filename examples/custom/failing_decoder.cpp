// A decoder whose n-th call fails, around another decoder: with it a test can break off a decoding at every
// step and look at what is left.
#include <cstdint>
#include <cstdio>
#include <expected>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <orv/decoder.hpp>
#include <orv/group.hpp>
#include "word_decoder.hpp"

namespace {

// An error type of this decoder's own. decodeMessage answers it as it was made.
struct Broken {
  int call = 0;
  std::string reason;
};

template <orv::Decoder Inner>
class FailingDecoder {
 public:
  using Error = Broken;
  using Result = std::expected<void, Broken>;

  FailingDecoder(Inner& inner, int failingCall) : inner_(inner), failingCall_(failingCall) {}

  template <class M>
  std::expected<std::optional<std::uint32_t>, Broken> nextFieldNumber(M& message) {
    if (auto counted = count(); !counted) return std::unexpected(counted.error());
    auto number = inner_.nextFieldNumber(message);
    if (!number) return std::unexpected(Broken{calls_, number.error()});
    return *number;
  }

  template <class Slot>
  Result decodeSingularStringField(Slot& slot) {
    return call([&] { return inner_.decodeSingularStringField(slot); });
  }
  template <class Slot>
  Result decodeSingularBytesField(Slot& slot) {
    return call([&] { return inner_.decodeSingularBytesField(slot); });
  }
  template <class Slot>
  Result decodeSingularBoolField(Slot& slot) {
    return call([&] { return inner_.decodeSingularBoolField(slot); });
  }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>& slot) {
    return call([&] { return inner_.decodeSingularUInt32Field(slot); });
  }
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>& slot) {
    return call([&] { return inner_.decodeSingularEnumField(slot); });
  }
  Result decodeRepeatedStringField(std::vector<orv::Text>& texts) {
    return call([&] { return inner_.decodeRepeatedStringField(texts); });
  }

  // Nested messages are read through this decoder, not through the inner one: their calls count too.
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    if (auto counted = count(); !counted) return counted;
    M message = slot.value_or(M{});
    auto read = message.decodeMessage(*this);
    if (read) slot = std::move(message);
    return read;
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    if (auto counted = count(); !counted) return counted;
    M message;
    auto read = message.decodeMessage(*this);
    if (read) messages.push_back(std::move(message));
    return read;
  }

  Result handleConflictingOneOf() {
    return call([&] { return inner_.handleConflictingOneOf(); });
  }

 private:
  Result count() {
    if (++calls_ == failingCall_) return std::unexpected(Broken{calls_, "as ordered"});
    return {};
  }

  template <class Operation>
  Result call(Operation operation) {
    if (auto counted = count(); !counted) return counted;
    if (auto done = operation(); !done) return std::unexpected(Broken{calls_, done.error()});
    return {};
  }

  Inner& inner_;
  int failingCall_;
  int calls_ = 0;
};

std::string contentsOf(const orv::Group::Initialization& event) {
  std::string contents = "groupUUID=" + std::string(event.groupUuid().characters());
  for (const orv::Member& member : event.members()) {
    contents += ", " + std::string(member.handle().utf8());
    if (member.hasTokenID()) contents += " with " + std::string(member.tokenID().utf8());
  }
  return contents;
}

}  // namespace

int main() {
  constexpr std::string_view wanted =
      "groupUUID=0123 members{ handle=anna@tablet tokenID=t1 } members{ handle=ben@phone }";
  for (int failingCall = 1;; ++failingCall) {
    words::WordDecoder inner(wanted);
    FailingDecoder decoder(inner, failingCall);
    orv::Group::Initialization event;
    const auto read = event.decodeMessage(decoder);
    if (read) {
      std::printf("no call fails: %s\n", contentsOf(event).c_str());
      return 0;
    }
    std::printf("call %2d fails, %s: %s\n", read.error().call, read.error().reason.c_str(),
                contentsOf(event).c_str());
  }
}

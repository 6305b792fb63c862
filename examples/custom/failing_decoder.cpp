// A decoder whose n-th call fails, around another decoder: with it a test can break off a decoding at every
// step and look at what is left.
#include <cstdint>
#include <cstdio>
#include <expected>
#include <optional>
#include <string>
#include <string_view>

#include <orv/any_value_decoder.hpp>
#include <orv/group.hpp>
#include "word_decoder.hpp"

namespace {

// An error type of this decoder's own. decodeMessage answers it as it was made.
struct Broken {
  int call = 0;
  std::string reason;
};

template <class Inner>
class FailingDecoder : public orv::AnyValueDecoder<FailingDecoder<Inner>, Broken> {
 public:
  FailingDecoder(Inner& inner, int failingCall) : inner_(inner), failingCall_(failingCall) {}

  template <class M>
  std::expected<std::optional<std::uint32_t>, Broken> nextFieldNumber(M& message) {
    return call([&] { return inner_.nextFieldNumber(message); });
  }
  template <class T>
  std::expected<bool, Broken> readAnyValue(T& value) {
    return call([&] { return inner_.readAnyValue(value); });
  }
  // Nested messages are read through this decoder, not through the inner one: their calls count too.
  template <class M>
  std::expected<bool, Broken> readAnyMessage(M& message) {
    if (++calls_ == failingCall_) return std::unexpected(Broken{calls_, "as ordered"});
    if (auto read = message.decodeMessage(*this); !read) return std::unexpected(read.error());
    return true;
  }

 private:
  // What the inner decoder answers, with the error type of this one.
  template <class Operation>
  auto call(Operation operation) -> std::expected<typename decltype(operation())::value_type, Broken> {
    if (++calls_ == failingCall_) return std::unexpected(Broken{calls_, "as ordered"});
    auto answer = operation();
    if (!answer) return std::unexpected(Broken{calls_, answer.error()});
    return *answer;
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

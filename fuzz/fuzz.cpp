// All fuzzers in one program, which is the one that its name says: each entry of the table below is a link to it.
#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include <orv/json.hpp>
#include "tests/testing/accessors.hpp"
#include "tests/testing/nested_messages.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/properties.hpp"

namespace orv::test {
namespace {

// What libFuzzer gives: choices first, in single bytes, and then the bytes that are tried.
class Input {
 public:
  explicit Input(std::string_view bytes) : bytes_(bytes) {}

  std::size_t choice() {
    if (bytes_.empty()) return 0;
    const auto byte = static_cast<unsigned char>(bytes_[0]);
    bytes_.remove_prefix(1);
    return byte;
  }
  const AnyMessage& type() { return *allMessages()[choice() % allMessages().size()]; }
  // So many bytes as the next one says.
  std::string_view part() {
    const std::size_t size = choice();
    const std::string_view taken = bytes_.substr(0, size);
    bytes_.remove_prefix(taken.size());
    return taken;
  }
  std::string_view rest() const { return bytes_; }
  // One input in so many, always the same ones: for what takes long.
  bool isOneIn(std::size_t count) const { return std::hash<std::string_view>()(bytes_) % count == 0; }

 private:
  std::string_view bytes_;
};

// Read, written and read again; everything else that holds of an encoding now and then.
std::string decode(Input input) {
  const AnyMessage& type = input.type();
  const std::string_view bytes = input.rest();
  if (input.isOneIn(32)) return faultOfReading(type, bytes);
  const auto message = type.parse(bytes);
  if (!message) return message.error().offset <= bytes.size() ? "" : "the error is outside the input";
  const auto encoding = (*message)->serialize();
  const auto again = type.parse(encoding.value());
  if (!again || !(**again == **message)) return "it is unequal to what its encoding gives";
  if (input.isOneIn(4)) return "";
  // In the memory of a message that held something else.
  const MessagePointer reused = type.copied();
  (void)reused->merge(bytes.substr(bytes.size() / 2));
  if (!reused->reparse(bytes) || !(*reused == **message)) return "reparse leaves something else";
  return "";
}

std::string merge(Input input) {
  const AnyMessage& type = input.type();
  const std::string_view left = input.part();
  if (std::string fault = faultOfMerging(type, left, input.rest()); !fault.empty()) return fault;
  return faultOfRefusing(type, input.rest());
}

std::string accessors(Input input) {
  const AnyMessage& type = input.type();
  return faultOfScript(type, input.rest());
}

// Bytes as text; most stand for code points that compose, decompose, or are put into order.
std::string textOf(std::string_view bytes) {
  static constexpr std::array<std::string_view, 32> pieces{
      "a",      "e",      "A",      "\u00E9", "\u0301", "\u0316", "\u0345", "\u030A",
      "\u00C5", "\u212B", "\u0327", "\u1F82", "\u03B1", "\u0313", "\u0300", "\u1100",
      "\u1161", "\u11A8", "\uAC00", "\uAC01", "\u0F71", "\u0F72", "\u0F73", "\u2126",
      "\u03A9", "K",      "\u212A", "\u0344", "\u0308", "\u1E0B", "\u0323", "\U0001D15E"};
  std::string text;
  for (const char byte : bytes) {
    const auto choice = static_cast<unsigned char>(byte);
    if (choice < 0xA0) {
      text += pieces[choice % pieces.size()];
    } else {
      text += byte;
    }
  }
  return text;
}

std::string equality(Input input) {
  const bool isRaw = input.choice() % 4 == 0;
  const auto text = [&](std::string_view bytes) { return isRaw ? std::string(bytes) : textOf(bytes); };
  const std::string first = text(input.part()), second = text(input.part()), third = text(input.rest());
  // The slow normalisation takes quadratic time.
  if (first.size() + second.size() + third.size() > 600) return "";
  return faultOfComparing({first, second, third});
}

std::string stream(Input input) {
  const std::string_view pieces = input.part();
  return faultOfStream(input.rest(), pieces);
}

template <class M>
std::string faultOfJson(std::string_view text) {
  const auto message = json::parse<M>(text);
  if (!message) return message.error().message().empty() ? "the error says nothing" : "";
  const std::string rendered = json::render(*message);
  const auto again = json::parse<M>(rendered);
  if (!again) return "its own rendering is refused: " + again.error().message();
  if (!(*again == *message)) return "it is unequal to what its rendering gives";
  if (json::render(*again) != rendered) return "rendered again it is another text";
  const auto decoded = M::parse(message->serialize().value());
  if (!decoded || !(*decoded == *message)) return "its encoding gives another message";
  return "";
}

std::string json(Input input) {
  const std::string_view name = input.type().fullName();
  std::string fault;
  AllMessages::forEach([&]<class M>() {
    if (M::protoMessageName == name) fault = faultOfJson<M>(input.rest());
  });
  return fault;
}

std::string differential(Input input) {
  const AnyMessage& type = input.type();
  return readBesideOfficial(type, input.rest(), input.isOneIn(8)).fault;
}

struct Fuzzer {
  std::string_view name;
  std::string (*faultOf)(Input input);
};

constexpr Fuzzer fuzzers[] = {
    {"accessors", accessors}, {"decode", decode}, {"differential", differential},
    {"equality", equality},   {"json", json},     {"merge", merge},
    {"stream", stream},
};

const Fuzzer* chosen = nullptr;

}  // namespace
}  // namespace orv::test

extern "C" int LLVMFuzzerInitialize(const int* /*argumentCount*/, char*** arguments) {
  std::string_view name = **arguments;
  name.remove_prefix(name.rfind('/') + 1);
  for (const auto& fuzzer : orv::test::fuzzers) {
    if (name == fuzzer.name) orv::test::chosen = &fuzzer;
  }
  if (orv::test::chosen == nullptr) {
    std::fprintf(stderr, "there is no fuzzer with the name that this program was called by\n");
    std::exit(2);
  }
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  const std::string fault = orv::test::chosen->faultOf(orv::test::Input(bytes));
  if (!fault.empty()) {
    std::fprintf(stderr, "%s: %s\n", orv::test::chosen->name.data(), fault.c_str());
    std::abort();
  }
  return 0;
}

#include "tests/testing/any_message.hpp"

#include <algorithm>
#include <sstream>

#include <orv/all_messages.hpp>

namespace orv::test {

namespace {

template <class M>
class MessageOf final : public AnyMessage {
 public:
  explicit MessageOf(M message) : message_(std::move(message)) {}

  std::string_view fullName() const override { return M::protoMessageName; }
  NameMap nameMap() const override { return M::_protobuf_nameMap(); }
  const MessageDescriptor& descriptor() const override { return M::descriptor(); }
  bool isInitialized() const override { return M::isInitialized(); }

  MessagePointer copied() const override { return std::make_unique<MessageOf>(message_); }
  MessagePointer moved() override { return std::make_unique<MessageOf>(std::move(message_)); }
  void assign(const AnyMessage& other) override { message_ = static_cast<const MessageOf&>(other).message_; }
  void assignMoved(AnyMessage& other) override {
    message_ = std::move(static_cast<MessageOf&>(other).message_);
  }

  bool isEqualTo(const AnyMessage& other) const override {
    bool isEqual = false;
    AllMessages::forEach([&]<class Other>() {
      if (other.fullName() != Other::protoMessageName) return;
      isEqual = message_.isEqualTo(static_cast<const MessageOf<Other>&>(other).message_);
    });
    return isEqual;
  }
  std::weak_ordering order(const AnyMessage& other) const override {
    return message_ <=> static_cast<const MessageOf&>(other).message_;
  }
  std::uint64_t hashValue() const override { return message_.hashValue(); }
  std::string debugDescription() const override { return message_.debugDescription(); }
  std::string printed() const override { return (std::ostringstream() << message_).str(); }
  std::string redactedDescription() const override { return message_.redactedDescription(); }
  UnknownStorage& mutableUnknownFields() override { return message_.mutableUnknownFields(); }

  std::expected<MessagePointer, DecodeError> parse(std::span<const std::byte> bytes) const override {
    auto message = M::parse(bytes);
    if (!message) return std::unexpected(message.error());
    return std::make_unique<MessageOf>(std::move(*message));
  }
  std::expected<void, DecodeError> merge(std::string_view bytes) override { return message_.merge(bytes); }
  std::expected<void, DecodeError> reparse(std::string_view bytes) override {
    return message_.reparse(bytes);
  }
  std::expected<void, ScriptedError> decode(ScriptedDecoder& decoder) override {
    return message_.decodeMessage(decoder);
  }

  std::expected<std::string, EncodeError> serialize() const override { return message_.serialize(); }
  std::expected<std::size_t, EncodeError> serializeInto(std::span<std::byte> buffer) const override {
    return message_.serializeInto(buffer);
  }
  std::size_t encodedSize() const override { return message_.encodedSize(); }

 private:
  template <class Other>
  friend class MessageOf;

  M message_;
};

}  // namespace

const std::vector<MessagePointer>& allMessages() {
  static const auto* const all = [] {
    auto* const list = new std::vector<MessagePointer>;
    AllMessages::forEach([&]<class M>() { list->push_back(std::make_unique<MessageOf<M>>(M())); });
    return list;
  }();
  return *all;
}

const AnyMessage& messageNamed(std::string_view name) {
  const auto found = std::ranges::find_if(allMessages(), [&](const MessagePointer& message) {
    return message->fullName() == name || message->fullName().substr(4) == name;
  });
  if (found == allMessages().end()) std::abort();
  return **found;
}

std::string faultOfEncoding(const AnyMessage& message) {
  const auto encoded = message.serialize();
  if (!encoded) return "it cannot be encoded";
  if (message.encodedSize() != encoded->size()) return "encodedSize is not the size of the encoding";
  std::vector<std::byte> exact(encoded->size());
  const auto written = message.serializeInto(exact);
  if (!written || *written != exact.size()) return "it does not fit a buffer of its encoded size";
  if (!std::ranges::equal(exact, std::as_bytes(std::span(*encoded))))
    return "serializeInto writes other bytes";
  if (!exact.empty() && message.serializeInto(std::span(exact).first(exact.size() - 1)))
    return "it fits a buffer that is too small";

  const auto again = message.parse(*encoded);
  if (!again) return "its own encoding is refused: " + again.error().message();
  if (!(**again == message)) return "it is unequal to what its encoding gives";
  if ((*again)->hashValue() != message.hashValue()) return "it is hashed unlike its equal";
  if ((*again)->debugDescription() != message.debugDescription()) return "it is described unlike its equal";
  if ((*again)->serialize() != encoded) return "encoded again it has other bytes";
  return "";
}

std::string faultOfReading(const AnyMessage& type, std::string_view bytes) {
  const auto message = type.parse(bytes);
  const MessagePointer merged = type.copied();
  const auto result = merged->merge(bytes);
  if (message.has_value() != result.has_value()) return "parse and merge disagree";
  if (std::string fault = faultOfEncoding(*merged); !fault.empty()) return fault;
  const MessagePointer reused = merged->copied();
  if (reused->reparse(bytes) != result) return "reparse ends otherwise";
  if (!(*reused == *merged)) return "reparse leaves something else";
  if (!message) {
    if (message.error() != result.error()) return "parse and merge err differently";
    if (message.error().offset > bytes.size()) return "the error is outside the input";
    if (!message.error().message().starts_with(type.fullName())) return "the error names no field";
    return "";
  }
  if (!(**message == *merged)) return "parse and merge read different messages";

  // Reading two encodings one behind the other is reading one and merging the other.
  const auto twice = type.parse(std::string(bytes) + std::string(bytes));
  if (!twice) return "its encoding is refused when it stands there twice";
  if (!merged->merge(bytes) || !(*merged == **twice)) return "merging differs from reading on";
  return faultOfEncoding(*merged);
}

}  // namespace orv::test

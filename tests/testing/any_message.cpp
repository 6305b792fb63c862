#include "tests/testing/any_message.hpp"

#include <algorithm>
#include <sstream>

#include "tests/testing/nested_messages.hpp"

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
    TestedMessages::forEach([&]<class Other>() {
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
  void* address() override { return &message_; }

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
  std::expected<void, DecodeError> decode(BinaryDecoder& decoder) override {
    return message_.decodeMessage(decoder);
  }
  TracingVisitor::Result traverse(TracingVisitor& visitor) const override {
    return message_.traverse(visitor);
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
    TestedMessages::forEach([&]<class M>() { list->push_back(std::make_unique<MessageOf<M>>(M())); });
    return list;
  }();
  return *all;
}

const AnyMessage& messageNamed(std::string_view name) {
  const auto found = std::ranges::find_if(allMessages(), [&](const MessagePointer& message) {
    return message->fullName() == name ||
           message->fullName().substr(message->fullName().find('.') + 1) == name;
  });
  if (found == allMessages().end()) std::abort();
  return **found;
}

}  // namespace orv::test

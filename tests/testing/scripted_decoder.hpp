// A decoder that is no BinaryDecoder: it plays back a list of fields, notes what it is asked for and fails
// when told to.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/decoder.hpp>
#include <orv/text.hpp>

namespace orv::test {

// Without a value, it is a field that no operation takes.
struct ScriptedField {
  std::uint32_t number;
  std::variant<std::monostate, std::string, std::int64_t, std::vector<ScriptedField>> value{};
};

// An error type of its own. An error equals itself alone, so a test sees that it came back as it was made.
using ScriptedError = std::shared_ptr<const int>;

// What a decoder and those of its nested messages share.
struct Journal {
  std::vector<std::string> calls{};
  std::size_t fieldsDone = 0;  // of the outermost message
  std::size_t failingCall = SIZE_MAX;
  bool throws = false;  // the error, in place of answering it
  bool refusesConflicts = false;
  ScriptedError error = std::make_shared<int>();
};

class ScriptedDecoder {
 public:
  using Error = ScriptedError;
  using Result = std::expected<void, Error>;

  ScriptedDecoder(std::span<const ScriptedField> fields, Journal& journal, bool isOutermost = true)
      : fields_(fields), journal_(journal), isOutermost_(isOutermost) {}

  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M&) {
    if (isOutermost_) journal_.fieldsDone = next_;
    if (auto noted = note("nextFieldNumber"); !noted) return std::unexpected(noted.error());
    if (next_ == fields_.size()) return std::nullopt;
    return fields_[next_++].number;
  }

  Result decodeSingularStringField(Text& value) { return take<std::string>("string", value); }
  Result decodeSingularStringField(std::optional<Text>& value) {
    return take<std::string>("optional string", value);
  }
  Result decodeSingularBytesField(ByteBuffer& value) { return take<std::string>("bytes", value); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>& value) {
    return take<std::string>("optional bytes", value);
  }
  Result decodeSingularBoolField(bool& value) { return take<std::int64_t>("bool", value); }
  Result decodeSingularBoolField(std::optional<bool>& value) {
    return take<std::int64_t>("optional bool", value);
  }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>& value) {
    return take<std::int64_t>("optional uint32", value);
  }
  template <class E>
  Result decodeSingularEnumField(std::optional<E>& value) {
    return take<std::int64_t>("optional enum", value);
  }
  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    Text text;
    auto taken = take<std::string>("repeated string", text);
    if (taken && held<std::string>()) texts.push_back(std::move(text));
    return taken;
  }
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    return read<M>(
        "message ", [&] { return slot.value_or(M()); }, [&](M message) { slot = message; });
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    return read<M>(
        "repeated message ", [] { return M(); }, [&](M message) { messages.push_back(message); });
  }
  Result handleConflictingOneOf() {
    auto noted = note("handleConflictingOneOf");
    if (noted && journal_.refusesConflicts) return std::unexpected(journal_.error);
    return noted;
  }

 private:
  Result note(std::string call) {
    journal_.calls.push_back(std::move(call));
    if (journal_.calls.size() - 1 != journal_.failingCall) return {};
#ifdef __cpp_exceptions
    if (journal_.throws) throw journal_.error;
#endif
    return std::unexpected(journal_.error);
  }

  template <class Value>
  const Value* held() const {
    return std::get_if<Value>(&fields_[next_ - 1].value);
  }

  template <class Value, class Storage>
  Result take(const char* type, Storage& storage) {
    if (auto noted = note(type); !noted) return noted;
    if (const Value* const value = held<Value>()) assign(storage, *value);
    return {};
  }
  template <class Storage, class Value>
  static void assign(std::optional<Storage>& storage, const Value& value) {
    assign(storage.emplace(), value);
  }
  template <class Storage, class Value>
  static void assign(Storage& storage, const Value& value) {
    storage = static_cast<Storage>(value);
  }

  template <class M>
  Result read(const char* call, auto start, auto store) {
    if (auto noted = note(call + std::string(M::protoMessageName)); !noted) return noted;
    const auto* const fields = held<std::vector<ScriptedField>>();
    if (fields == nullptr) return {};
    M message = start();
    ScriptedDecoder nested(*fields, journal_, false);
    auto decoded = message.decodeMessage(nested);
    if (decoded) store(std::move(message));
    return decoded;
  }

  std::span<const ScriptedField> fields_;
  std::size_t next_ = 0;
  Journal& journal_;
  bool isOutermost_;
};

static_assert(Decoder<ScriptedDecoder>);

}  // namespace orv::test

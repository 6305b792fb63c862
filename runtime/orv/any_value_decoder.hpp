// A base for decoders that treat many kinds of fields alike.
#pragma once

#include <cstdint>
#include <expected>
#include <optional>
#include <utility>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/decoder.hpp>
#include <orv/text.hpp>

namespace orv::inline v0 {

// Has Derived read each value that is no message, the elements of a list one by one:
//
//   std::expected<bool, Error> readAnyValue(T& value)
//
// where T is Text, ByteBuffer, bool, std::uint32_t or an enumeration, and the answer whether the field was
// taken; one that was not keeps its old value. And a nested message, which holds what is there to be merged
// into:
//
//   template <class M> std::expected<bool, Error> readAnyMessage(M& message)
//
// Derived adds nextFieldNumber, and declares those operations of its own for which it has something better to
// do. A second member of a oneof is accepted.
template <class Derived, class E>
class AnyValueDecoder {
 public:
  using Error = E;
  using Result = std::expected<void, E>;

  Result decodeSingularStringField(Text& value) { return replace(value); }
  Result decodeSingularStringField(std::optional<Text>& value) { return replace(value); }
  Result decodeSingularBytesField(ByteBuffer& value) { return replace(value); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>& value) { return replace(value); }
  Result decodeSingularBoolField(bool& value) { return replace(value); }
  Result decodeSingularBoolField(std::optional<bool>& value) { return replace(value); }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>& value) { return replace(value); }
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>& value) {
    std::optional<Enumeration> read(Enumeration(0));
    return store(self().readAnyValue(*read), [&] { value = read; });
  }
  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    Text read;
    return store(self().readAnyValue(read), [&] { texts.push_back(std::move(read)); });
  }
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    M message = slot.has_value() ? *slot : M();
    return store(self().readAnyMessage(message), [&] { slot = std::move(message); });
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    M message;
    return store(self().readAnyMessage(message), [&] { messages.push_back(std::move(message)); });
  }
  Result handleConflictingOneOf() { return {}; }

 private:
  Derived& self() { return static_cast<Derived&>(*this); }

  template <class Store>
  Result store(std::expected<bool, E> isTaken, Store storeRead) {
    if (!isTaken) return std::unexpected(std::move(isTaken.error()));
    if (*isTaken) storeRead();
    return {};
  }
  template <class T>
  Result replace(T& value) {
    T read{};
    return store(self().readAnyValue(read), [&] { value = std::move(read); });
  }
  template <class T>
  Result replace(std::optional<T>& value) {
    T read{};
    return store(self().readAnyValue(read), [&] { value = std::move(read); });
  }
};

}  // namespace orv

#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "bench/peers/equal_work.hpp"
#include "bench/workloads/workloads.hpp"
#include "orv_c.pb-c.h"

namespace bench {

class ProtobufCMessageOwner {
 public:
  ProtobufCMessageOwner() = default;
  ProtobufCMessageOwner(const ProtobufCMessageOwner&) = delete;
  ProtobufCMessageOwner& operator=(const ProtobufCMessageOwner&) = delete;
  ~ProtobufCMessageOwner() { reset(nullptr); }

  void reset(ProtobufCMessage* message) {
    protobuf_c_message_free_unpacked(message_, nullptr);
    message_ = message;
  }
  const ProtobufCMessage* get() const { return message_; }

 private:
  ProtobufCMessage* message_ = nullptr;
};

// Less than equal work: text is not checked. It copies no message and decodes into fresh ones only.
struct ProtobufC : EqualWork {
  static constexpr std::string_view name = "protobuf-c";
  static constexpr bool checksText = false;
  static constexpr bool reusesMemory = false;

  static constexpr const ProtobufCMessageDescriptor* descriptions[] = {
      &orv_c__session_message__descriptor,
      &orv_c__connection_request__descriptor,
      &orv_c__connection_response__content__descriptor,
      &orv_c__join_request__descriptor,
      &orv_c__join_request__content__descriptor,
      &orv_c__join_response__content__descriptor,
      &orv_c__group__descriptor,
  };

  template <Kind kind>
  struct Value : ProtobufCMessageOwner {
    static constexpr const ProtobufCMessageDescriptor* description = descriptions[static_cast<int>(kind)];
  };

  static bool decode(auto& value, std::string_view bytes) {
    value.reset(protobuf_c_message_unpack(value.description, nullptr, bytes.size(),
                                          reinterpret_cast<const std::uint8_t*>(bytes.data())));
    return value.get() != nullptr;
  }
  static bool decodeAgain(auto& value, std::string_view bytes) { return decode(value, bytes); }
  static std::string encode(const auto& value) {
    std::string bytes(protobuf_c_message_get_packed_size(value.get()), '\0');
    encodeInto(value, bytes);
    return bytes;
  }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    return protobuf_c_message_pack(value.get(), reinterpret_cast<std::uint8_t*>(buffer.data()));
  }
};

}  // namespace bench

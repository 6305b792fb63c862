#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>
#include <tuple>

#include <pb_decode.h>
#include <pb_encode.h>

#include "bench/workloads/workloads.hpp"
#include "orv_nanopb.pb.h"

namespace bench {

// A decoded message whose fields are pointers into the heap.
template <class Message>
class NanopbMessage {
 public:
  static const pb_msgdesc_t* description() { return nanopb::MessageDescriptor<Message>::fields(); }

  NanopbMessage() = default;
  NanopbMessage(const NanopbMessage&) = delete;
  NanopbMessage& operator=(const NanopbMessage&) = delete;
  ~NanopbMessage() { pb_release(description(), &message); }

  Message message{};
};

// Less than equal work: unknown fields are dropped, and the packaged library is built without its check of
// text. It copies no message; its lists and contents have at most 65,535 elements and bytes.
struct Nanopb {
  static constexpr std::string_view name = "nanopb";
  static constexpr bool checksText = false;
  static constexpr bool keepsUnknownFields = false;
  static constexpr bool reusesMemory = false;
  static constexpr std::size_t largest = 65'535;

  template <Kind kind>
  using Value = NanopbMessage<std::tuple_element_t<
      static_cast<std::size_t>(kind),
      std::tuple<orv_nanopb_SessionMessage, orv_nanopb_ConnectionRequest,
                 orv_nanopb_ConnectionResponse_Content, orv_nanopb_JoinRequest,
                 orv_nanopb_JoinRequest_Content, orv_nanopb_JoinResponse_Content, orv_nanopb_Group>>>;

  static bool decode(auto& value, std::string_view bytes) {
    auto stream = pb_istream_from_buffer(reinterpret_cast<const pb_byte_t*>(bytes.data()), bytes.size());
    return pb_decode(&stream, value.description(), &value.message);
  }
  static bool decodeAgain(auto& value, std::string_view bytes) {
    pb_release(value.description(), &value.message);
    return decode(value, bytes);
  }
  static std::string encode(const auto& value) {
    std::size_t size = 0;
    pb_get_encoded_size(&size, value.description(), &value.message);
    std::string bytes(size, '\0');
    encodeInto(value, bytes);
    return bytes;
  }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    auto stream = pb_ostream_from_buffer(reinterpret_cast<pb_byte_t*>(buffer.data()), buffer.size());
    pb_encode(&stream, value.description(), &value.message);
    return stream.bytes_written;
  }
};

}  // namespace bench

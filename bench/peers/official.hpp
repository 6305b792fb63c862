#pragma once

#include <google/protobuf/util/message_differencer.h>

#include "bench/peers/official_code.hpp"
#include "orv_official.pb.h"

namespace bench {

// The baseline: a message as a local variable, with all that it holds on the heap. No other way to have one
// without an arena is cheaper.
struct Official : OfficialCode<orv_official::SessionMessage, orv_official::ConnectionRequest,
                               orv_official::ConnectionResponse_Content, orv_official::JoinRequest,
                               orv_official::JoinRequest_Content, orv_official::JoinResponse_Content,
                               orv_official::Group> {
  static constexpr std::string_view name = "official";

  static bool equal(const auto& left, const auto& right) {
    return google::protobuf::util::MessageDifferencer::Equals(left, right);
  }
  static std::string text(const auto& value) { return value.DebugString(); }
};

}  // namespace bench

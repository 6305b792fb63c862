#pragma once

#include "bench/peers/official_code.hpp"
#include "orv_lite.pb.h"

namespace bench {

// The lite runtime: the same code without descriptors, hence without comparison and without rendering as
// text.
struct OfficialLite
    : OfficialCode<orv_lite::SessionMessage, orv_lite::ConnectionRequest,
                   orv_lite::ConnectionResponse_Content, orv_lite::JoinRequest, orv_lite::JoinRequest_Content,
                   orv_lite::JoinResponse_Content, orv_lite::Group> {
  static constexpr std::string_view name = "official-lite";
};

}  // namespace bench

// The wire types of unknown fields by name.
#pragma once

#include <array>
#include <string_view>

namespace orv::inline v0::json {

// In the order of WireType.
inline constexpr std::array<std::string_view, 6> wireTypeNames{"varint",     "fixed64",  "lengthDelimited",
                                                               "startGroup", "endGroup", "fixed32"};

}  // namespace orv::json

// The schema of the protocol, for peers in other languages and for the text format.
#pragma once

#include <string_view>

namespace orv::tool {

// proto/orv.proto, as it was when the command was built.
std::string_view schema();

}  // namespace orv::tool

// What the operators << of templates come down to, so that no header includes <ostream>.
#pragma once

#include <cstdint>
#include <iosfwd>
#include <string_view>

#include <orv/name_map.hpp>

namespace orv::inline v0::internal {

std::ostream& print(std::ostream& out, std::string_view characters);
// The name of a number, or the number where it has none.
std::ostream& printName(std::ostream& out, NameMap names, std::int64_t number);

}  // namespace orv::internal

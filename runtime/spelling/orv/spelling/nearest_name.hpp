// What a misspelled name was probably meant to be.
#pragma once

#include <span>
#include <string>
#include <string_view>

#include <orv/name_map.hpp>

namespace orv::spelling {

// The candidate that is spelled most like `name`, letter case aside; empty when none is close.
std::string_view nearestName(std::string_view name, std::span<const std::string_view> candidates);

// ` (did you mean "handle"?)` with the nearest candidate, or nothing.
std::string suggestion(std::string_view name, std::span<const std::string_view> candidates);
std::string suggestion(std::string_view name, NameMap candidates);

}  // namespace orv::spelling

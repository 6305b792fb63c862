// What a misspelled name was probably meant to be.
#pragma once

#include <functional>
#include <iterator>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace orv::inline v0::spelling {

// ` (did you mean "handle"?)` with the candidate that is spelled most like `name`, letter case aside; nothing
// when none is close.
std::string suggestion(std::string_view name, std::span<const std::string_view> candidates);

// The same for things that have a name.
template <class Things, class NameOf>
std::string suggestion(std::string_view name, const Things& things, NameOf nameOf) {
  std::vector<std::string_view> names;
  names.reserve(std::size(things));
  for (const auto& thing : things) names.push_back(std::invoke(nameOf, thing));
  return suggestion(name, names);
}

}  // namespace orv::spelling

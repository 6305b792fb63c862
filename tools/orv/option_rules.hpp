// What options mean together.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "tools/orv/options.hpp"

namespace orv::tool {

// A number of bytes: digits, and K, M or G for powers of 1024, also as KB and KiB.
std::optional<std::size_t> sizeInBytes(std::string_view text);

// Fills in the defaults of the command. The answer says what is wrong with the options, if anything is.
std::optional<std::string> completeOptions(Options& options);

}  // namespace orv::tool

// The manual page.
#pragma once

#include <string>
#include <string_view>

#include "tools/orv/command_line.hpp"

namespace orv::tool {

// The page in mdoc(7). The date is that of its contents: "November 22, 2025".
std::string manPage(const CommandLineDescription& line, std::string_view date);

}  // namespace orv::tool

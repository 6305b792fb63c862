// Help for who asks for it.
#pragma once

#include <cstddef>
#include <string>

#include "tools/orv/command_line.hpp"

namespace orv::tool {

// Both are set for a terminal of so many columns; 0 stands for 80.
std::string helpText(const CommandLineDescription& line, std::size_t width);
std::string helpText(const CommandDescription& command, std::size_t width);

}  // namespace orv::tool

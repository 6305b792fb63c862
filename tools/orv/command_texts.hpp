// The words of help and manual page.
#pragma once

#include <string_view>
#include <vector>

#include "tools/orv/command_line.hpp"

namespace orv::tool {

// All but the options of the commands, in the order of Command.
CommandLineDescription describeCommandLine();

std::vector<std::string_view> commandNames();

}  // namespace orv::tool

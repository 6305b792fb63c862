// The invitation's parts, each in its process.
#pragma once

#include "examples/invitation/options.hpp"
#include "examples/invitation/outcome.hpp"

namespace invitation {

// Does what the options ask for. A failure is reported on standard error; the answer is the exit status.
int play(const Options& options);

}  // namespace invitation

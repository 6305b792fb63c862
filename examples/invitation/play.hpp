// Who plays which part, in which process.
#pragma once

#include "examples/invitation/options.hpp"
#include "examples/invitation/outcome.hpp"

namespace invitation {

// Does what the options ask for. Whoever fails says so on standard error; the answer is the exit status.
int play(const Options& options);

}  // namespace invitation

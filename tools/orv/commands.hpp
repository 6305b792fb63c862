// The subcommands. Each reports what fails and answers the status to exit with.
#pragma once

#include "tools/orv/failure.hpp"
#include "tools/orv/options.hpp"

namespace orv::tool {

// decode, encode and convert, which differ in their default formats.
ExitStatus runConvert(const Options& options);
ExitStatus runInspect(const Options& options);
ExitStatus runDiff(const Options& options);
ExitStatus runIdentify(const Options& options);
ExitStatus runTypes(const Options& options);
ExitStatus runSchema(const Options& options);

}  // namespace orv::tool

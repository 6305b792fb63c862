// The loop over the input files that several subcommands share.
#pragma once

#include <expected>
#include <string>

#include "tools/orv/failure.hpp"
#include "tools/orv/options.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/progress.hpp"

namespace orv::tool {

// Calls `work` with each file's path and writes what it left in the output. A file that fails is reported,
// behind the output that came before, and the others go on; the first failure gives the status.
template <class Work>
ExitStatus forEachFile(const Options& options, OutputFile& output, Progress& progress, Work work) {
  ExitStatus status = ExitStatus::done;
  for (const std::string& path : options.files) {
    Outcome<void> outcome = work(path);
    progress.clear();
    if (outcome) continue;
    if (auto flushed = output.flush(); !flushed) outcome = std::unexpected(flushed.error());
    report(outcome.error());
    if (output.hasFailed()) return outcome.error().status;
    if (status == ExitStatus::done) status = outcome.error().status;
  }
  if (auto finished = status == ExitStatus::done ? output.finish() : output.flush(); !finished) {
    report(finished.error());
    return finished.error().status;
  }
  return status;
}

}  // namespace orv::tool

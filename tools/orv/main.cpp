// The command orv.
#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <new>
#include <utility>

#include "tools/orv/commands.hpp"
#include "tools/orv/options.hpp"
#include "tools/orv/output_file.hpp"

namespace orv::tool {
namespace {

// In the order of Command.
constexpr std::array run{runConvert, runConvert,  runInspect, runConvert,
                         runDiff,    runIdentify, runTypes,   runSchema};

// A file that is opened must not take the place of a standard descriptor that was closed.
void occupyStandardDescriptors() {
  for (int descriptor = STDIN_FILENO; descriptor <= STDERR_FILENO; ++descriptor) {
    // The wrong way round, so that use of it fails.
    const int mode = descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY;
    if (::fcntl(descriptor, F_GETFD) < 0) (void)::open("/dev/null", mode);
  }
}

ExitStatus answer(const Answer& given) {
  OutputFile output(std::nullopt);
  auto written = output.write(given.text);
  if (written) written = output.finish();
  if (written) return ExitStatus::done;
  report(written.error());
  return written.error().status;
}

ExitStatus runCommandLine(int argumentCount, const char* const* arguments) {
  const auto request = parseCommandLine(argumentCount, arguments);
  if (const auto* const failure = std::get_if<Failure>(&request)) {
    report(*failure);
    return failure->status;
  }
  if (const auto* const text = std::get_if<Answer>(&request)) return answer(*text);
  const auto& options = std::get<Options>(request);
  return run[static_cast<std::size_t>(options.command)](options);
}

}  // namespace
}  // namespace orv::tool

int main(int argumentCount, char** arguments) {
  using orv::tool::ExitStatus;
  // A write to a closed pipe fails, and ends the work, without a signal.
  std::signal(SIGPIPE, SIG_IGN);
  orv::tool::occupyStandardDescriptors();
  try {
    return static_cast<int>(orv::tool::runCommandLine(argumentCount, arguments));
  } catch (const std::bad_alloc&) {
    orv::tool::report({ExitStatus::fileError, "orv: out of memory"});
    return static_cast<int>(ExitStatus::fileError);
  }
}

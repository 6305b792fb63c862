// The command orv.
#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <new>
#include <span>
#include <variant>

#include "tools/orv/command_line/command.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {
namespace {

// A file that is opened must not take the place of a standard descriptor that was closed.
void occupyStandardDescriptors() {
  for (int descriptor = STDIN_FILENO; descriptor <= STDERR_FILENO; ++descriptor) {
    // The wrong way round, so that use of it fails.
    const int mode = descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY;
    if (::fcntl(descriptor, F_GETFD) < 0) (void)::open("/dev/null", mode);
  }
}

ExitStatus runCommandLine(std::span<char*> words) {
  const auto parsed = parseCommandLine(words);
  if (const auto* const request = std::get_if<Request>(&parsed))
    return request->command->run(request->options);
  if (const auto* const answer = std::get_if<Answer>(&parsed)) return writeWhole(answer->text);
  report(std::get<Failure>(parsed));
  return std::get<Failure>(parsed).status;
}

}  // namespace
}  // namespace orv::tool

int main(int argumentCount, char** arguments) {
  using orv::tool::ExitStatus;
  // A write to a closed pipe fails, and ends the work, without a signal.
  std::signal(SIGPIPE, SIG_IGN);
  orv::tool::occupyStandardDescriptors();
  try {
    return static_cast<int>(orv::tool::runCommandLine({arguments, static_cast<std::size_t>(argumentCount)}));
  } catch (const std::bad_alloc&) {
    orv::tool::report({ExitStatus::fileError, "orv: out of memory"});
    return static_cast<int>(ExitStatus::fileError);
  }
}

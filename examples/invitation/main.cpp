// A whole invitation: a host and two guests, each a process of its own, on a local socket.
#include <sodium.h>

#include <csignal>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <span>
#include <string_view>

#include "examples/invitation/options.hpp"
#include "examples/invitation/play.hpp"

namespace {

// A signal makes the wait under way fail, so that an interrupted program removes its files like any other
// that fails.
void failOnSignals() {
  struct sigaction action {};
  action.sa_handler = [](int) {};
  for (const int signal : {SIGHUP, SIGINT, SIGTERM}) ::sigaction(signal, &action, nullptr);
  action.sa_handler = SIG_IGN;
  ::sigaction(SIGPIPE, &action, nullptr);
}

}  // namespace

int main(int argumentCount, char** arguments) {
  constexpr int wrongUsage = 2;
  const std::span<const char* const> words(arguments, static_cast<std::size_t>(argumentCount));
  for (const std::string_view word : words) {
    if (word == "--help") {
      std::fwrite(invitation::usage.data(), 1, invitation::usage.size(), stdout);
      return EXIT_SUCCESS;
    }
  }
  const auto options = invitation::parseOptions(words.subspan(words.empty() ? 0 : 1));
  if (!options) {
    std::fprintf(stderr, "invitation: %s\n", options.error().message.c_str());
    return wrongUsage;
  }
  if (sodium_init() < 0) {
    std::fputs("invitation: libsodium does not start\n", stderr);
    return EXIT_FAILURE;
  }
  failOnSignals();
  return invitation::play(*options);
}

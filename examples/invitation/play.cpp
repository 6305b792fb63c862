#include "examples/invitation/play.hpp"

#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <utility>

#include "examples/invitation/capture.hpp"
#include "examples/invitation/guest.hpp"
#include "examples/invitation/host.hpp"
#include "examples/invitation/narrator.hpp"
#include "examples/invitation/private_directory.hpp"
#include "examples/invitation/processes.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

namespace {

int conclude(std::string_view who, const Outcome<>& outcome) {
  if (outcome) return EXIT_SUCCESS;
  Narrator{std::string(who)}.complain(outcome.error().message);
  return EXIT_FAILURE;
}

int playGuestToTheEnd(const std::string& socketPath, const story::Person& guest, const Options& options) {
  const bool behaves = guest.name != story::anna.name;
  return conclude(guest.name, playGuest(socketPath, guest, options.timeLimit,
                                        behaves ? Misbehaviour::none : options.misbehaviour));
}

Outcome<> playHostAlone(const Options& options) {
  auto capture = Capture::create(options.capturePath);
  if (!capture) return std::unexpected(capture.error());
  auto listener = Listener::listenAt(options.socketPath);
  if (!listener) return std::unexpected(listener.error());
  const SocketFileRemover remover(options.socketPath);
  return playHost(std::move(*listener), *capture, options.timeLimit);
}

// The host and the guests in processes of their own; the second guest comes when the first has ended.
Outcome<> playAll(const Options& options) {
  auto capture = Capture::create(options.capturePath);
  if (!capture) return std::unexpected(capture.error());
  const auto place = PrivateDirectory::create();
  if (!place) return std::unexpected(place.error());
  const std::string socketPath = place->path() + "/host";
  auto listener = Listener::listenAt(socketPath);
  if (!listener) return std::unexpected(listener.error());
  const SocketFileRemover remover(socketPath);

  // More waits than any side has; each ends within the time limit.
  constexpr int waits = 40;
  const Deadline deadline = std::chrono::steady_clock::now() + waits * options.timeLimit;
  Processes processes(3 * options.timeLimit);
  const auto host = processes.start([&] {
    return conclude(story::host.name, playHost(std::move(*listener), *capture, options.timeLimit));
  });
  if (!host) return std::unexpected(host.error());
  // Only the host's process listens now: if it ends early, guests are refused instead of left waiting.
  *listener = Listener();
  for (const story::Person& guest : {story::anna, story::ben}) {
    const auto process = processes.start([&] { return playGuestToTheEnd(socketPath, guest, options); });
    if (!process) return std::unexpected(process.error());
    if (auto ended = processes.awaitEnd(*process, deadline); !ended) return ended;
    if (!processes.areWell()) break;
  }
  if (auto ended = processes.awaitEnd(*host, deadline); !ended) return ended;
  if (!processes.areWell()) return failure("the invitation did not go as it should");
  return {};
}

}  // namespace

int play(const Options& options) {
  switch (options.part) {
    case Options::Part::host: return conclude(story::host.name, playHostAlone(options));
    case Options::Part::guest: return playGuestToTheEnd(options.socketPath, options.guest, options);
    case Options::Part::all: break;
  }
  const auto played = playAll(options);
  if (!played) std::fprintf(stderr, "invitation: %s\n", played.error().message.c_str());
  return played ? EXIT_SUCCESS : EXIT_FAILURE;
}

}  // namespace invitation

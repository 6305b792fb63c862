#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace bench {

// Runs an operation so many times, on objects of its own; where a workload has many messages they take turns.
using Loop = std::function<void(std::size_t iterations)>;

// One operation of one peer on one workload.
struct Case {
  std::string operation;
  std::string workload;
  std::string_view peer;
  std::string_view set;
  // After how many iterations all messages of the workload have had their turn.
  std::size_t messages;
  // How many threads run it at once.
  int threads;
  // Makes the objects anew, wherever the heap puts them now.
  std::function<Loop()> prepare;
};

// One decoded value of one peer: calls back while it holds the value.
struct Holding {
  std::string workload;
  std::string_view peer;
  std::size_t sizeOf;
  std::size_t members;
  std::function<void(const std::function<void()>& whileHeld)> run;
};

// Everything that can be measured. Filled peer by peer; the programs pick what they need.
struct Catalogue {
  std::vector<Case> cases;
  std::vector<Holding> holdings;
};

// The peers. Each is defined in its own header under peers/ and added by its own source file, so that headers
// which cannot stand together never meet.
struct Official;
struct OfficialArena;
struct OfficialLite;
struct Protozero;
struct Nanopb;
struct ProtobufC;
struct Upb;
struct Floor;
struct Orv;

// Checks that the peer does what it says with every workload (and ends the program if not), then adds its
// cases.
template <class Peer>
void addPeer(Catalogue& catalogue);

// Adds every peer that is linked and is one of `names`; all where there are none. From then on the official
// code logs nothing: it would log every ill-formed text that it refuses.
Catalogue allPeers(const std::vector<std::string_view>& names = {});

}  // namespace bench

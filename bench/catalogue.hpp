#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace bench {

// One operation of one peer on one workload, to be run as often as wanted.
struct Case {
  std::string operation;
  std::string workload;
  std::string_view peer;
  std::function<void(std::size_t iterations)> run;
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
struct Floor;
struct Orv;

// Checks that the peer does what it says with every workload (and ends the program if not), then adds its
// cases.
template <class Peer>
void addPeer(Catalogue& catalogue);

// Adds every peer that is linked.
Catalogue allPeers();

}  // namespace bench

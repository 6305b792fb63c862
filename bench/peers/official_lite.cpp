#include "bench/peers/official_lite.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::OfficialLite>(Catalogue&);

#include "bench/peers/official.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::Official>(Catalogue&);

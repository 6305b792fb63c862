#include "bench/peers/orv.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::Orv>(Catalogue&);

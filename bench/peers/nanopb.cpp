#include "bench/peers/nanopb.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::Nanopb>(Catalogue&);

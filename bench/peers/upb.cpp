#include "bench/peers/upb.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::Upb>(Catalogue&);

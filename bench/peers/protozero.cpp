#include "bench/peers/protozero.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::Protozero>(Catalogue&);

#include "bench/peers/official_arena.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::OfficialArena>(Catalogue&);

#include "bench/peers/official_arena.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::OfficialArena>(); }

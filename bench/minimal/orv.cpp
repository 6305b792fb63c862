#include "bench/peers/orv.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::Orv>(); }

#include "bench/peers/nanopb.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::Nanopb>(); }

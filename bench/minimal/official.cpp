#include "bench/peers/official.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::Official>(); }

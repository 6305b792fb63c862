#include "bench/peers/official_lite.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::OfficialLite>(); }

#include "bench/peers/upb.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::Upb>(); }

#include "bench/peers/protozero.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::Protozero>(); }

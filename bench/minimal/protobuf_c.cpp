#include "bench/peers/protobuf_c.hpp"

#include "bench/minimal/round_trip.hpp"

int main() { return bench::roundTrip<bench::ProtobufC>(); }

#include "bench/peers/protobuf_c.hpp"

#include "bench/peer_cases.hpp"

template void bench::addPeer<bench::ProtobufC>(Catalogue&);

#pragma once

#include <string_view>

#include "bench/workloads/workloads.hpp"

namespace bench {

// The smallest use of a peer: decodes one envelope and encodes it again. Answers the program's exit status.
template <class Peer>
int roundTrip() {
  constexpr std::string_view envelope("\x08\x01\x10\x05\x1A\x04\xDE\xAD\xBE\xEF", 10);
  typename Peer::template Value<Kind::sessionMessage> value;
  return Peer::decode(value, envelope) && Peer::encode(value) == envelope ? 0 : 1;
}

}  // namespace bench

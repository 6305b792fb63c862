#include <google/protobuf/stubs/logging.h>

#include <algorithm>
#include <utility>

#include "bench/catalogue.hpp"

namespace bench {

Catalogue allPeers(const std::vector<std::string_view>& names) {
  using Add = void (*)(Catalogue&);
  static constexpr std::pair<std::string_view, Add> peers[] = {
      {"orv", addPeer<Orv>},
      {"official", addPeer<Official>},
      {"official-arena", addPeer<OfficialArena>},
      {"official-lite", addPeer<OfficialLite>},
      {"protozero", addPeer<Protozero>},
#ifdef ORV_BENCH_UPB
      {"upb", addPeer<Upb>},
#endif
      {"nanopb", addPeer<Nanopb>},
      {"protobuf-c", addPeer<ProtobufC>},
      {"floor", addPeer<Floor>},
  };
  google::protobuf::SetLogHandler(nullptr);
  Catalogue catalogue;
  for (const auto& [name, add] : peers) {
    if (names.empty() || std::ranges::find(names, name) != names.end()) add(catalogue);
  }
  return catalogue;
}

}  // namespace bench

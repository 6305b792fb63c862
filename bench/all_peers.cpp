#include <google/protobuf/stubs/logging.h>

#include "bench/catalogue.hpp"

namespace bench {

Catalogue allPeers() {
  // The official code logs every ill-formed text that it refuses; not while the peers are checked.
  google::protobuf::LogHandler* const logHandler = google::protobuf::SetLogHandler(nullptr);
  Catalogue catalogue;
  addPeer<Orv>(catalogue);
  addPeer<Official>(catalogue);
  addPeer<OfficialArena>(catalogue);
  addPeer<OfficialLite>(catalogue);
  addPeer<Protozero>(catalogue);
  addPeer<Nanopb>(catalogue);
  addPeer<ProtobufC>(catalogue);
  addPeer<Floor>(catalogue);
  google::protobuf::SetLogHandler(logHandler);
  return catalogue;
}

}  // namespace bench

#include <cstdlib>
#include <cstring>

#include "bench/peer_cases.hpp"

namespace bench {
namespace {

struct Slot {
  char* characters = nullptr;
  std::size_t size = 0;
};

// Gives each payload a piece of the heap of its own, as ordinary owning strings would.
void fill(std::vector<Slot>& slots, const std::vector<std::string>& payloads) {
  for (std::size_t i = 0; i < payloads.size(); ++i) {
    slots[i] = {static_cast<char*>(std::malloc(payloads[i].size())), payloads[i].size()};
    std::memcpy(slots[i].characters, payloads[i].data(), payloads[i].size());
  }
}

void release(std::vector<Slot>& slots) {
  for (Slot& slot : slots) std::free(slot.characters);
}

void add(Catalogue& catalogue, const char* operation, const Workload& workload, auto body) {
  catalogue.cases.push_back({operation, workload.name, "floor", [body](std::size_t iterations) {
                               for (; iterations != 0; --iterations) body();
                             }});
}

void addFresh(Catalogue& catalogue, const char* operation, const Workload& workload) {
  const auto slots = std::make_shared<std::vector<Slot>>(workload.payloads.size());
  add(catalogue, operation, workload, [slots, w = &workload] {
    fill(*slots, w->payloads);
    keep(*slots);
    release(*slots);
  });
}

void addCopies(Catalogue& catalogue, const Workload& workload) {
  const Workload* const w = &workload;
  const auto kept = std::make_shared<std::vector<std::string>>(w->payloads);
  add(catalogue, "decode-reused", workload, [w, kept] {
    for (std::size_t i = 0; i < kept->size(); ++i) {
      std::memcpy((*kept)[i].data(), w->payloads[i].data(), w->payloads[i].size());
    }
    keep(*kept);
  });
  add(catalogue, "encode-fresh", workload, [w] { keep(std::string(w->bytes)); });
  const auto buffer = std::make_shared<std::string>(w->bytes);
  add(catalogue, "encode-buffer", workload, [w, buffer] {
    std::memcpy(buffer->data(), w->bytes.data(), w->bytes.size());
    keep(*buffer);
  });
}

}  // namespace

// Not a peer but the floor of those that own ordinary strings: the payloads are known beforehand and only
// allocated and copied into an object that stands ready; encoding is one copy of the finished bytes.
template <>
void addPeer<Floor>(Catalogue& catalogue) {
  for (const Workload& workload : workloads()) {
    addFresh(catalogue, "decode-fresh", workload);
    addFresh(catalogue, "copy", workload);
    addCopies(catalogue, workload);
  }
  for (const Workload& workload : scalingWorkloads()) addFresh(catalogue, "per-member", workload);
}

}  // namespace bench

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
void fill(std::vector<Slot>& slots, const ByteStrings& payloads) {
  for (std::size_t i = 0; i < payloads.size(); ++i) {
    slots[i] = {static_cast<char*>(std::malloc(payloads[i].size())), payloads[i].size()};
    std::memcpy(slots[i].characters, payloads[i].data(), payloads[i].size());
  }
}

void release(std::vector<Slot>& slots) {
  for (Slot& slot : slots) std::free(slot.characters);
}

void add(Catalogue& catalogue, const char* operation, const Workload& workload, auto prepare) {
  const char* const set = workload.set == Set::first   ? "first"
                          : workload.set == Set::later ? "later"
                                                       : "scaling";
  catalogue.cases.push_back({operation, workload.name, "floor", set, 1, 1, [prepare]() -> Loop {
                               return [body = prepare()](std::size_t iterations) {
                                 for (; iterations != 0; --iterations) body();
                               };
                             }});
}

void addFresh(Catalogue& catalogue, const char* operation, const Workload& workload) {
  add(catalogue, operation, workload, [w = &workload] {
    return [w, slots = std::make_shared<std::vector<Slot>>(w->payloads.size())] {
      fill(*slots, w->payloads);
      keep(*slots);
      release(*slots);
    };
  });
}

void addCopies(Catalogue& catalogue, const Workload& workload) {
  add(catalogue, "decode-reused", workload, [w = &workload] {
    return [w, kept = std::make_shared<std::vector<std::string>>(w->payloads.begin(), w->payloads.end())] {
      for (std::size_t i = 0; i < kept->size(); ++i) {
        std::memcpy((*kept)[i].data(), w->payloads[i].data(), w->payloads[i].size());
      }
      keep(*kept);
    };
  });
  add(catalogue, "encode-fresh", workload, [w = &workload] {
    return [bytes = std::make_shared<std::string>(w->bytes.front())] { keep(std::string(*bytes)); };
  });
  add(catalogue, "encode-buffer", workload, [w = &workload] {
    const PageBuffer buffer(w->bytes.front().size());
    return [bytes = std::make_shared<std::string>(w->bytes.front()), buffer] {
      std::memcpy(std::span<char>(buffer).data(), bytes->data(), bytes->size());
      keep(buffer);
    };
  });
}

}  // namespace

// Not a peer but the floor of those that own ordinary strings: the payloads are known beforehand and only
// allocated and copied into an object that stands ready; encoding is one copy of the finished bytes.
template <>
void addPeer<Floor>(Catalogue& catalogue) {
  for (const Workload& workload : workloads()) {
    if (workload.bytes.size() != 1) continue;
    if (workload.set == Set::scaling) {
      addFresh(catalogue, "per-member", workload);
      continue;
    }
    addFresh(catalogue, "decode-fresh", workload);
    addFresh(catalogue, "copy", workload);
    addCopies(catalogue, workload);
  }
}

}  // namespace bench

#pragma once

#include <concepts>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <span>
#include <string>
#include <utility>

#include "bench/catalogue.hpp"
#include "bench/workloads/workloads.hpp"

namespace bench {

// What a peer offers. `decode` fills a fresh value, `decodeAgain` replaces what a value held; both answer
// whether the bytes were accepted. Beyond this a peer may offer `equal`, `hash` and `text`, and a value that
// can be copied.
template <class Peer>
concept MeasuredPeer = requires(typename Peer::template Value<Kind::group> value, std::string bytes,
                                std::span<char> buffer) {
  { Peer::name } -> std::convertible_to<std::string_view>;
  { Peer::checksText } -> std::convertible_to<bool>;
  { Peer::keepsUnknownFields } -> std::convertible_to<bool>;
  { Peer::reusesMemory } -> std::convertible_to<bool>;
  { Peer::mostMembers } -> std::convertible_to<std::size_t>;
  { Peer::decode(value, bytes) } -> std::same_as<bool>;
  { Peer::decodeAgain(value, bytes) } -> std::same_as<bool>;
  { Peer::encode(value) } -> std::same_as<std::string>;
  { Peer::encodeInto(value, buffer) } -> std::same_as<std::size_t>;
};

// Makes the compiler believe that the object is looked at and that any memory may change here.
template <class T>
void keep(const T& object) {
  asm volatile("" : : "r"(&object) : "memory");
}

// A caller's buffer has a little room to spare: some peers write a nested message a few bytes further on
// first.
inline constexpr std::size_t bufferSlack = 64;

// A buffer that lives as long as the program. It starts with a page: where the heap happens to put a short
// one across two, encoding into it takes up to three times as long.
inline std::span<char> callersBuffer(std::size_t size) {
  constexpr std::size_t page = 4096;
  return {static_cast<char*>(std::aligned_alloc(page, (size + page - 1) / page * page)), size};
}

inline void require(bool holds, std::string_view peer, const Workload& workload, const char* what) {
  if (holds) return;
  std::fprintf(stderr, "%.*s: %s: %s\n", static_cast<int>(peer.size()), peer.data(), workload.name.c_str(),
               what);
  std::exit(1);
}

template <MeasuredPeer Peer, Kind kind>
void verify(const Workload& workload) {
  using Value = typename Peer::template Value<kind>;
  const auto expect = [&](bool holds, const char* what) { require(holds, Peer::name, workload, what); };
  const std::string& expected = Peer::keepsUnknownFields ? workload.bytes : workload.knownBytes;

  Value value;
  expect(Peer::decode(value, workload.bytes), "decodes");
  expect(Peer::encode(value) == expected, "encodes to the same bytes");
  std::string buffer(workload.bytes.size() + bufferSlack, '\0');
  buffer.resize(Peer::encodeInto(value, buffer));
  expect(buffer == expected, "encodes to the same bytes in a caller's buffer");
  expect(Peer::decodeAgain(value, workload.bytes) && Peer::encode(value) == expected,
         "replaces what a value held");

  Value damaged;
  expect(!Peer::decodeAgain(damaged, workload.truncated), "refuses truncated bytes");
  for (const std::string& bytes : {workload.illFormedFirst, workload.illFormedLast}) {
    if (!bytes.empty())
      expect(Peer::decodeAgain(damaged, bytes) != Peer::checksText, "checks text as it says");
  }
  if constexpr (std::copy_constructible<Value>) {
    const Value copy = value;
    expect(Peer::encode(copy) == expected, "copies all");
    if constexpr (requires { Peer::equal(value, copy); }) {
      expect(Peer::equal(value, copy), "finds a copy equal");
      Value decomposed;
      if (!workload.decomposed.empty()) {
        expect(Peer::decode(decomposed, workload.decomposed), "decodes decomposed text");
        expect(Peer::equal(value, decomposed) == Peer::equatesNormalForms, "compares text as it says");
      }
    }
  }
}

// The two that are compared are decoded anew, so that no peer profits from sharing.
template <MeasuredPeer Peer, Kind kind>
auto decoded(const std::string& bytes) {
  auto value = std::make_shared<typename Peer::template Value<kind>>();
  Peer::decode(*value, bytes);
  return value;
}

template <MeasuredPeer Peer, Kind kind>
void addCases(Catalogue& catalogue, const Workload& workload, bool scalingOnly) {
  using Value = typename Peer::template Value<kind>;
  const Workload* const w = &workload;
  const auto add = [&](std::string operation, auto body) {
    catalogue.cases.push_back(
        {std::move(operation), workload.name, Peer::name, [body](std::size_t iterations) {
           for (; iterations != 0; --iterations) body();
         }});
  };
  const auto decodeFresh = [](const std::string& bytes) {
    return [&bytes] {
      Value value;
      keep(Peer::decode(value, bytes));
      keep(value);
    };
  };
  catalogue.holdings.push_back({workload.name, Peer::name, sizeof(Value), workload.members,
                                [w](const std::function<void()>& whileHeld) {
                                  Value value;
                                  Peer::decode(value, w->bytes);
                                  whileHeld();
                                }});
  if (scalingOnly) return add("per-member", decodeFresh(w->bytes));

  add("decode-fresh", decodeFresh(w->bytes));
  const auto value = decoded<Peer, kind>(w->bytes);
  if constexpr (Peer::reusesMemory) {
    add("decode-reused", [w, reused = decoded<Peer, kind>(w->bytes)] {
      keep(Peer::decodeAgain(*reused, w->bytes));
      keep(*reused);
    });
  }
  add("encode-fresh", [value] {
    keep(*value);
    keep(Peer::encode(*value));
  });
  add("encode-buffer", [value, buffer = callersBuffer(w->bytes.size() + bufferSlack)] {
    keep(*value);
    keep(Peer::encodeInto(*value, buffer));
  });
  if constexpr (std::copy_constructible<Value>) {
    add("copy", [value] {
      keep(*value);
      const Value copy = *value;
      keep(copy);
    });
  }
  if constexpr (requires { Peer::equal(*value, *value); }) {
    const auto compare = [&](const char* operation, const std::string& bytes) {
      add(operation, [value, other = decoded<Peer, kind>(bytes)] {
        keep(*value);
        keep(*other);
        keep(Peer::equal(*value, *other));
      });
    };
    compare("equal", w->bytes);
    if (!w->decomposed.empty()) compare("equal-normal-form", w->decomposed);
  }
  if constexpr (requires { Peer::hash(*value); }) {
    add("hash", [value] {
      keep(*value);
      keep(Peer::hash(*value));
    });
  }
  if constexpr (requires { Peer::text(*value); }) {
    add("text", [value] {
      keep(*value);
      keep(Peer::text(*value));
    });
  }
  add("refuse-truncated", decodeFresh(w->truncated));
  if (Peer::checksText && !w->illFormedFirst.empty()) {
    add("refuse-text", decodeFresh(w->illFormedFirst));
    add("refuse-last-text", decodeFresh(w->illFormedLast));
  }
}

template <MeasuredPeer Peer, Kind kind>
void addWorkload(Catalogue& catalogue, const Workload& workload, bool scalingOnly) {
  if (workload.members > Peer::mostMembers) return;
  verify<Peer, kind>(workload);
  addCases<Peer, kind>(catalogue, workload, scalingOnly);
}

template <class Peer>
void addPeer(Catalogue& catalogue) {
  static_assert(MeasuredPeer<Peer>);
  using Add = void (*)(Catalogue&, const Workload&, bool);
  static constexpr Add add[] = {
      addWorkload<Peer, Kind::sessionMessage>,
      addWorkload<Peer, Kind::connectionRequest>,
      addWorkload<Peer, Kind::connectionResponseContent>,
      addWorkload<Peer, Kind::joinRequest>,
      addWorkload<Peer, Kind::joinRequestContent>,
      addWorkload<Peer, Kind::joinResponseContent>,
      addWorkload<Peer, Kind::group>,
  };
  for (const Workload& workload : workloads())
    add[static_cast<int>(workload.kind)](catalogue, workload, false);
  for (const Workload& workload : scalingWorkloads())
    add[static_cast<int>(workload.kind)](catalogue, workload, true);
}

}  // namespace bench

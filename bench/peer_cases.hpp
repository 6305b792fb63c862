#pragma once

#include <algorithm>
#include <concepts>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "bench/catalogue.hpp"
#include "bench/peers/protozero.hpp"
#include "bench/placement.hpp"
#include "bench/workloads/workloads.hpp"

namespace bench {

// What a peer offers. `decode` fills a fresh value, `decodeAgain` replaces what a value held; both answer
// whether the bytes were accepted. Beyond this a peer may offer `parse`, which gives a fresh value, `build`
// from a plain message, `weigh`, which reads every field, `equal`, `hash` and `text`, and a value that can be
// copied.
template <class Peer>
concept MeasuredPeer = requires(typename Peer::template Value<Kind::group> value, std::string bytes,
                                std::span<char> buffer) {
  { Peer::name } -> std::convertible_to<std::string_view>;
  { Peer::checksText } -> std::convertible_to<bool>;
  { Peer::keepsUnknownFields } -> std::convertible_to<bool>;
  { Peer::reusesMemory } -> std::convertible_to<bool>;
  { Peer::largest } -> std::convertible_to<std::size_t>;
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

// Decodes into a fresh value, in the way that the peer has for it, and hands it on.
template <class Peer, class Value>
[[gnu::always_inline]] inline void decodeFresh(std::string_view bytes, auto use) {
  if constexpr (requires { Peer::template parse<Value>(bytes); }) {
    const auto parsed = Peer::template parse<Value>(bytes);
    keep(parsed);
    if (parsed) use(*parsed);
  } else {
    Value value;
    if (Peer::decode(value, bytes)) use(value);
    keep(value);
  }
}

// One peer and one workload.
template <MeasuredPeer Peer, Kind kind>
class PeerCases {
 public:
  PeerCases(Catalogue& catalogue, const Workload& workload) : catalogue_(catalogue), workload_(workload) {}

  // Every peer has to do all that it is measured with. Of very many messages the first must do.
  void verify() const {
    constexpr std::size_t most = 1'000;
    const ByteStrings& expected = Peer::keepsUnknownFields ? workload_.bytes : workload_.knownBytes;
    Value again;
    for (std::size_t i = 0; i < std::min(most, workload_.bytes.size()); ++i) {
      verifyMessage(again, workload_.bytes[i], workload_.knownBytes[i], expected[i]);
    }
    for (const Refused& refused : workload_.refused) {
      if (refused.random) continue;
      expect(refusesAll(refused) == (Peer::checksText || !refused.onlyForText), refused.operation.c_str());
    }
    if constexpr (hasEqual) {
      if (workload_.decomposed.empty()) return;
      expect(Peer::equal(*decoded(workload_.bytes.front()), *decoded(workload_.decomposed.front())) ==
                 Peer::equatesNormalForms,
             "compares text as it says");
    }
  }

  void add() {
    addHolding();
    if (workload_.set == Set::scaling) return addDecoding("per-member", workload_.bytes);
    addDecoding("decode-fresh", workload_.bytes);
    if constexpr (Peer::reusesMemory) addReuse();
    workload_.bytes.size() == 1 ? addForHeld<Value>() : addForHeld<OneOfMany>();
    if constexpr (isBuilt) addBuilding();
    for (const Refused& refused : workload_.refused) {
      if (refusesAll(refused)) addDecoding(refused.operation, refused.bytes);
    }
    if (workload_.set == Set::first) addRest();
    if (workload_.set == Set::later && workload_.bytes.size() <= 1'000) addThreads();
  }

 private:
  using Value = typename Peer::template Value<kind>;
  // How values are kept where there are thousands of them.
  using OneOfMany = typename decltype([] {
    if constexpr (requires { typename Peer::template OneOfMany<kind>; })
      return std::type_identity<typename Peer::template OneOfMany<kind>>();
    else
      return std::type_identity<Value>();
  }())::type;
  using Plain = plain::Message<kind>;
  static constexpr bool hasEqual = requires(const Value& value) { Peer::equal(value, value); };
  static constexpr bool isBuilt = requires(Value & value, const Plain& source) {
    Peer::build(value, source);
  };

  void expect(bool holds, const char* what) const {
    if (holds) return;
    std::fprintf(stderr, "%.*s: %s: %s\n", static_cast<int>(Peer::name.size()), Peer::name.data(),
                 workload_.name.c_str(), what);
    std::exit(1);
  }

  void verifyMessage(Value& again, std::string_view bytes, std::string_view known,
                     std::string_view expected) const {
    Value value;
    expect(Peer::decode(value, bytes), "decodes");
    expect(Peer::encode(value) == expected, "encodes to the same bytes");
    std::string buffer(bytes.size() + bufferSlack, '\0');
    buffer.resize(Peer::encodeInto(value, buffer));
    expect(buffer == expected, "encodes to the same bytes in a caller's buffer");
    expect(Peer::decodeAgain(again, bytes) && Peer::encode(again) == expected, "replaces what a value held");
    if constexpr (std::copy_constructible<Value>) {
      const Value copy = value;
      expect(Peer::encode(copy) == expected, "copies all");
      if constexpr (hasEqual) expect(Peer::equal(value, copy), "finds a copy equal");
    }
    if constexpr (isBuilt) {
      const std::unique_ptr<Plain> source = plainMessage(bytes);
      Value built;
      Peer::build(built, *source);
      expect(Peer::encode(built) == known, "builds the same message");
      expect(Peer::weigh(value) == weighPlain(*source), "reads every field");
    }
  }

  static bool refusesAll(const Refused& refused) {
    constexpr std::size_t most = 1'000;
    return std::ranges::none_of(std::span(refused.bytes).first(std::min(most, refused.bytes.size())),
                                [](std::string_view bytes) {
                                  Value value;
                                  return Peer::decode(value, bytes);
                                });
  }

  template <class Held = Value>
  static std::unique_ptr<Held> decoded(std::string_view bytes) {
    auto value = std::make_unique<Held>();
    Peer::decode(*value, bytes);
    return value;
  }
  static std::unique_ptr<Plain> plainMessage(std::string_view bytes) {
    auto message = std::make_unique<Plain>();
    Protozero::decode(*message, bytes);
    return message;
  }
  static Objects<const std::string> inputs(const ByteStrings& bytes) {
    return objectsFor<const std::string>(
        bytes, [](std::string_view message) { return std::make_unique<const std::string>(message); });
  }

  // `prepare` answers what is done with the message of a number; the loop stands beside it, compiled with it.
  template <class Prepare>
  void addCase(std::string operation, std::size_t messages, Prepare prepare, int threads = 1) {
    constexpr std::string_view sets[] = {"first", "later", "scaling"};
    catalogue_.cases.push_back({std::move(operation), workload_.name, Peer::name,
                                sets[static_cast<int>(workload_.set)], messages, threads,
                                [messages, prepare] { return loopOf(messages, prepare()); }});
  }
  template <class Body>
  static Loop loopOf(std::size_t messages, Body body) {
    if (messages == 1) {
      return [body](std::size_t iterations) {
        for (; iterations != 0; --iterations) body(0);
      };
    }
    return [body, messages, at = std::size_t{0}](std::size_t iterations) mutable {
      for (; iterations != 0; --iterations) {
        body(at);
        if (++at == messages) at = 0;
      }
    };
  }

  void addHolding() {
    if (workload_.bytes.size() != 1) return;
    catalogue_.holdings.push_back({workload_.name, Peer::name, sizeof(Value), workload_.members,
                                   [w = &workload_](const std::function<void()>& whileHeld) {
                                     Value value;
                                     Peer::decode(value, w->bytes.front());
                                     whileHeld();
                                   }});
  }

  void addDecoding(std::string operation, const ByteStrings& bytes) {
    addCase(std::move(operation), bytes.size(), [&bytes] {
      return [bytes = inputs(bytes)](std::size_t at) { decodeFresh<Peer, Value>(bytes[at], keep<Value>); };
    });
  }

  void addReuse() {
    addCase("decode-reused", workload_.bytes.size(), [w = &workload_] {
      const std::shared_ptr<Value> value = decoded(w->bytes.front());
      return [bytes = inputs(w->bytes), value](std::size_t at) {
        keep(Peer::decodeAgain(*value, bytes[at]));
        keep(*value);
      };
    });
  }

  template <class Held = Value, class Use>
  void addForValues(std::string operation, Use use) {
    addCase(std::move(operation), workload_.bytes.size(), [w = &workload_, use] {
      return [values = objectsFor<Held>(w->bytes, decoded<Held>), use](std::size_t at) {
        keep(values[at]);
        use(values[at]);
      };
    });
  }

  template <class Held>
  void addForHeld() {
    addForValues<Held>("encode-fresh", [](const Held& value) { keep(Peer::encode(value)); });
    addCase("encode-buffer", workload_.bytes.size(), [w = &workload_] {
      const PageBuffer buffer(std::ranges::max(w->bytes, {}, &std::pmr::string::size).size() + bufferSlack);
      return [values = objectsFor<Held>(w->bytes, decoded<Held>), buffer](std::size_t at) {
        keep(values[at]);
        keep(Peer::encodeInto(values[at], buffer));
      };
    });
    if constexpr (std::copy_constructible<Value>) {
      addForValues<Held>("copy", [](const Held& value) {
        const Value copy(value);
        keep(copy);
      });
    }
    if constexpr (hasEqual) addComparison<Held>("equal", workload_.bytes);
  }

  // The two that are compared are decoded anew, so that no peer profits from sharing.
  template <class Held = Value>
  void addComparison(std::string operation, const ByteStrings& others) {
    using Pair = std::pair<std::unique_ptr<Held>, std::unique_ptr<Held>>;
    addCase(std::move(operation), others.size(), [w = &workload_, &others] {
      auto other = others.begin();
      const auto pairs = objectsFor<Pair>(w->bytes, [&](std::string_view bytes) {
        return std::make_unique<Pair>(decoded<Held>(bytes), decoded<Held>(*other++));
      });
      return [pairs](std::size_t at) {
        const auto& [left, right] = pairs[at];
        keep(*left);
        keep(*right);
        keep(Peer::equal(*left, *right));
      };
    });
  }

  void addBuilding() {
    addCase("build-encode", workload_.bytes.size(), [w = &workload_] {
      return [sources = objectsFor<Plain>(w->bytes, plainMessage)](std::size_t at) {
        keep(sources[at]);
        Value value;
        Peer::build(value, sources[at]);
        keep(Peer::encode(value));
      };
    });
    addCase("decode-read", workload_.bytes.size(), [w = &workload_] {
      return [bytes = inputs(w->bytes)](std::size_t at) {
        decodeFresh<Peer, Value>(bytes[at], [](const Value& value) { keep(Peer::weigh(value)); });
      };
    });
  }

  void addRest() {
    if constexpr (hasEqual) {
      if (!workload_.decomposed.empty()) addComparison("equal-normal-form", workload_.decomposed);
    }
    if constexpr (requires(const Value& value) { Peer::hash(value); }) {
      addForValues("hash", [](const Value& value) { keep(Peer::hash(value)); });
    }
    if constexpr (requires(const Value& value) { Peer::text(value); }) {
      addForValues("text", [](const Value& value) { keep(Peer::text(value)); });
    }
  }

  // Each of two threads decodes and encodes messages of its own.
  void addThreads() {
    addCase(
        "two-threads", workload_.bytes.size(),
        [w = &workload_] {
          return [bytes = inputs(w->bytes)](std::size_t at) {
            decodeFresh<Peer, Value>(bytes[at], [](const Value& value) { keep(Peer::encode(value)); });
          };
        },
        2);
  }

  Catalogue& catalogue_;
  const Workload& workload_;
};

// Verifies first and adds later, so that what is added lies together.
template <class Peer, Kind kind>
void addWorkload(Catalogue& catalogue, const Workload& workload, bool onlyVerify) {
  const auto tooLarge = [](std::string_view payload) { return payload.size() > Peer::largest; };
  if (workload.members > Peer::largest || std::ranges::any_of(workload.payloads, tooLarge)) return;
  PeerCases<Peer, kind> cases(catalogue, workload);
  onlyVerify ? cases.verify() : cases.add();
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
  for (const bool onlyVerify : {true, false}) {
    for (const Workload& workload : workloads())
      add[static_cast<int>(workload.kind)](catalogue, workload, onlyVerify);
  }
}

}  // namespace bench

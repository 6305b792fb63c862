#pragma once

#include <google/protobuf/arena.h>

#include "bench/peers/official.hpp"

namespace bench {

// An arena with a message on it. The arena's first block is part of the value, so that a small message takes no
// block from the heap (texts beyond 15 bytes still do: the official strings own their characters).
template <class Message, std::size_t blockSize = 4096>
class ArenaMessage {
 public:
  ArenaMessage() : arena_(options()), message_(google::protobuf::Arena::CreateMessage<Message>(&arena_)) {}
  ArenaMessage(const ArenaMessage& other) : ArenaMessage() { message_->CopyFrom(*other); }
  template <std::size_t otherSize>
  explicit ArenaMessage(const ArenaMessage<Message, otherSize>& other) : ArenaMessage() {
    message_->CopyFrom(*other);
  }

  // Begins anew with the memory that the arena has.
  void reset() {
    arena_.Reset();
    message_ = google::protobuf::Arena::CreateMessage<Message>(&arena_);
  }

  Message& operator*() { return *message_; }
  const Message& operator*() const { return *message_; }

 private:
  google::protobuf::ArenaOptions options() {
    google::protobuf::ArenaOptions options;
    options.initial_block = block_;
    options.initial_block_size = sizeof block_;
    return options;
  }

  alignas(8) char block_[blockSize];
  google::protobuf::Arena arena_;
  Message* message_;
};

struct OfficialArena : Official {
  static constexpr std::string_view name = "official-arena";

  template <Kind kind>
  using Value = ArenaMessage<Official::Value<kind>>;
  // Where thousands are held at once: 4 KiB of each would fill the caches with next to nothing.
  template <Kind kind>
  using OneOfMany = ArenaMessage<Official::Value<kind>, 256>;

  static bool decode(auto& value, std::string_view bytes) { return Official::decode(*value, bytes); }
  static bool decodeAgain(auto& value, std::string_view bytes) {
    value.reset();
    return decode(value, bytes);
  }
  static std::string encode(const auto& value) { return Official::encode(*value); }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    return Official::encodeInto(*value, buffer);
  }
  static bool equal(const auto& left, const auto& right) { return Official::equal(*left, *right); }
  static std::string text(const auto& value) { return Official::text(*value); }
  static void build(auto& value, const auto& source) { Official::build(*value, source); }
  static std::size_t weigh(const auto& value) { return Official::weigh(*value); }
};

}  // namespace bench

// The decision on a second member of a oneof.
#pragma once

#include <concepts>
#include <expected>
#include <memory>
#include <type_traits>

#include <orv/decode_error.hpp>

namespace orv::inline v0 {

// What a BinaryDecoder asks when a oneof member arrives while its group already holds a case. It is asked,
// too, when the record of the case that is held has another wire type and changes nothing. It refers to a
// callable object that returns std::expected<void, DecodeError> and outlives it. An error refuses the member and
// ends the decoding; it reaches the caller as it was made. An exception leaves what memory that runs out does.
class ConflictHook {
 public:
  // Accepts: the member read last wins.
  constexpr ConflictHook() = default;

  template <class Callable>
  requires(std::is_object_v<Callable> && !std::same_as<std::remove_const_t<Callable>, ConflictHook> &&
           std::is_invocable_r_v<std::expected<void, DecodeError>, Callable&>)
      ConflictHook(Callable& callable)  // NOLINT(google-explicit-constructor): a callable is a hook
      // NOLINTNEXTLINE(cppcoreguidelines-pro-type-const-cast): the call gives it back its type
      : callable_(const_cast<std::remove_const_t<Callable>*>(std::addressof(callable))),
        call_([](void* target) -> std::expected<void, DecodeError> {
          return (*static_cast<Callable*>(target))();
        }) {}

  // Whether there is a callable to ask; without one every member is accepted.
  bool isSet() const { return call_ != nullptr; }

  std::expected<void, DecodeError> operator()() const {
    if (call_ == nullptr) return {};
    return call_(callable_);
  }

 private:
  void* callable_ = nullptr;
  std::expected<void, DecodeError> (*call_)(void*) = nullptr;
};

}  // namespace orv

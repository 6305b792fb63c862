// What the steps of the built-in decoder and encoder answer: whether they succeeded, in one register.
#pragma once

#include <cstdint>
#include <expected>

namespace orv::inline v0::internal {

// The error of such a step, an empty sign: what was wrong stands elsewhere, once. Why these are not
// std::expected: docs/decisions/error-sign.md.
struct Failed {};

// What std::expected<void, Failed> says.
class [[nodiscard]] Step {
 public:
  constexpr Step() = default;
  constexpr Step(std::unexpected<Failed>) : isTaken_(false) {}  // NOLINT(google-explicit-constructor)

  constexpr explicit operator bool() const { return isTaken_; }
  constexpr Failed error() const { return {}; }  // not covered: for whoever wraps a decoder or visitor

 private:
  bool isTaken_ = true;
};

// What std::expected<std::optional<std::uint32_t>, Failed> says of the number of the next field.
class [[nodiscard]] NextNumber {
 public:
  // A number, or none.
  class Optional {
   public:
    constexpr explicit Optional(std::uint32_t number) : number_(number) {}
    constexpr bool has_value() const { return number_ != 0; }
    constexpr std::uint32_t operator*() const { return number_; }

   private:
    std::uint32_t number_;
  };

  // 0 is none: no field has it.
  constexpr explicit NextNumber(std::uint32_t number) : number_(number) {}
  constexpr NextNumber(std::unexpected<Failed>) : number_(failed) {}  // NOLINT(google-explicit-constructor)

  constexpr explicit operator bool() const { return number_ != failed; }
  constexpr Optional operator*() const { return Optional(number_); }
  constexpr Failed error() const { return {}; }

 private:
  static constexpr std::uint32_t failed = 0xFFFFFFFF;  // above all field numbers

  std::uint32_t number_;
};

}  // namespace orv::internal

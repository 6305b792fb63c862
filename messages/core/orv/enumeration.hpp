// The rules of all open enumerations.
#pragma once

#include <array>
#include <compare>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <iosfwd>
#include <span>

#include <orv/hasher.hpp>
#include <orv/internal/printing.hpp>
#include <orv/name_map.hpp>

namespace orv::inline v0 {

// An open enumeration: named cases with fixed raw values, and any other 64-bit raw value as UNRECOGNIZED. Two
// values are equal when their raw values are, so UNRECOGNIZED with a named case's raw value is that case. On
// the wire a raw value travels in its low 32 bits, read back as a signed number: one outside that range
// cannot travel whole.
//
// E declares its cases as static members and lists them, in order of raw value, in a private table `cases` of
// NameMap::Entry.
template <class E>
class Enumeration {
 public:
  static constexpr E UNRECOGNIZED(std::int64_t rawValue) { return E(rawValue); }

  constexpr std::int64_t rawValue() const { return rawValue_; }
  constexpr bool isUnrecognized() const { return !_protobuf_nameMap().name(rawValue_).has_value(); }

  // The named cases in order of raw value.
  static constexpr std::span<const E> allCases() { return std::span<const E>(caseList<E>); }
  static constexpr NameMap _protobuf_nameMap() { return NameMap(E::cases); }

  friend constexpr bool operator==(const E& left, const E& right) {
    return left.rawValue() == right.rawValue();
  }
  // By raw value.
  friend constexpr std::strong_ordering operator<=>(const E& left, const E& right) {
    return left.rawValue() <=> right.rawValue();
  }
  // By name, or by number where the raw value has none.
  friend std::ostream& operator<<(std::ostream& out, const E& value) {
    return internal::printName(out, _protobuf_nameMap(), value.rawValue());
  }
  void hash(Hasher& into) const { into.combine(static_cast<std::uint64_t>(rawValue_)); }
  std::uint64_t hashValue() const {
    Hasher hasher;
    hash(hasher);
    return hasher.finish();
  }

 protected:
  constexpr explicit Enumeration(std::int64_t rawValue) : rawValue_(rawValue) {}

 private:
  template <class Complete>
  static constexpr auto caseList = [] {
    std::array<Complete, Complete::cases.size()> list;
    for (std::size_t at = 0; at < list.size(); ++at) list[at] = Complete(Complete::cases[at].number);
    return list;
  }();

  std::int64_t rawValue_;
};

}  // namespace orv

template <class E>
requires std::derived_from<E, orv::Enumeration<E>>
struct std::hash<E> : orv::internal::StandardHash<E> {
};

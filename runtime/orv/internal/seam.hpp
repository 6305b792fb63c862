// What the two seams, Decoder and Visitor, share.
#pragma once

#include <cstdint>
#include <expected>
#include <optional>

#include <orv/name_map.hpp>

namespace orv::inline v0::internal {

// What the operations of a decoder or visitor answer: its own Result where it names one, which then can
// do what std::expected<void, Error> can.
template <class Seam>
struct ResultOfSeam {
  using Type = std::expected<void, typename Seam::Error>;
};
template <class Seam>
requires requires { typename Seam::Result; }
struct ResultOfSeam<Seam> {
  using Type = typename Seam::Result;
};
template <class Seam>
using ResultOf = typename ResultOfSeam<Seam>::Type;

// What a decoder's nextFieldNumber answers: its own NextFieldNumber where it names one.
template <class D>
struct NextNumberOfDecoder {
  using Type = std::expected<std::optional<std::uint32_t>, typename D::Error>;
};
template <class D>
requires requires { typename D::NextFieldNumber; }
struct NextNumberOfDecoder<D> {
  using Type = typename D::NextFieldNumber;
};
template <class D>
using NextNumberOf = typename NextNumberOfDecoder<D>::Type;

// What operations on any enumeration may rely on: the concepts try them with this one.
class SomeEnumeration {
 public:
  explicit SomeEnumeration(std::int64_t rawValue);
  std::int64_t rawValue() const;
  static NameMap _protobuf_nameMap();
  template <class Hasher>
  void hash(Hasher&) const;
};

}  // namespace orv::internal

// Canonical equivalence of texts (Unicode 15.0, D70): their canonical decompositions are the same.
#pragma once

#include <compare>
#include <string_view>
#include <vector>

namespace orv::inline v0 {

// The canonical decomposition (NFD) of well-formed UTF-8, as code points. Time and memory are near-linear in
// the length for any input, long runs of combining marks included.
std::vector<char32_t> canonicalDecomposition(std::string_view utf8);

// The order of the canonical decompositions, code point by code point. Both are well-formed UTF-8.
std::strong_ordering canonicalOrder(std::string_view left, std::string_view right);

}  // namespace orv

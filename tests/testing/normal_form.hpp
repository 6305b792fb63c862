// Canonical equivalence by another library's normalisation, whose time is quadratic.
#pragma once

#include <utf8proc.h>

#include <cstdlib>
#include <string>
#include <string_view>

namespace orv::test {

// The canonical decomposition of well-formed UTF-8 that is not too long.
inline std::string slowDecomposition(std::string_view text) {
  utf8proc_uint8_t* result = nullptr;
  const auto size = utf8proc_map(reinterpret_cast<const utf8proc_uint8_t*>(text.data()),
                                 static_cast<utf8proc_ssize_t>(text.size()), &result,
                                 static_cast<utf8proc_option_t>(UTF8PROC_STABLE | UTF8PROC_DECOMPOSE));
  std::string decomposed(reinterpret_cast<const char*>(result), static_cast<std::size_t>(size));
  std::free(result);
  return decomposed;
}

}  // namespace orv::test

// Compares and hashes two texts, and does the same by another road, which is slow on long texts.
#include <cstdint>
#include <cstdlib>

#include <orv/text.hpp>
#include "tests/testing/normal_form.hpp"

namespace {

std::uint64_t hashOf(const orv::Text& text) {
  orv::Hasher hasher;
  text.hash(hasher);
  return hasher.finish();
}

void require(bool holds) {
  if (!holds) std::abort();
}

}  // namespace

// The first byte says where the second text begins.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0 || size > 200) return -1;
  const std::string_view bytes(reinterpret_cast<const char*>(data) + 1, size - 1);
  const std::size_t middle = data[0] % size;
  const orv::Text left = bytes.substr(0, middle), right = bytes.substr(middle);
  const std::string leftForm = orv::test::slowDecomposition(left.utf8());
  const std::string rightForm = orv::test::slowDecomposition(right.utf8());

  require(orv::Text::checked(left.utf8()).has_value());
  require((left == right) == (leftForm == rightForm));
  require((hashOf(left) == hashOf(right)) == (leftForm == rightForm));
  require(left == orv::Text(leftForm) && hashOf(left) == hashOf(leftForm));
  return 0;
}

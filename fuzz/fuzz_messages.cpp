// Reads any bytes as any message, and checks what the tests check of bytes.
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "tests/testing/any_message.hpp"

// The first byte says which message, the rest is its encoding.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return -1;
  const auto& types = orv::test::allMessages();
  const orv::test::AnyMessage& type = *types[data[0] % types.size()];
  const std::string fault =
      orv::test::faultOfReading(type, {reinterpret_cast<const char*>(data) + 1, size - 1});
  if (!fault.empty()) {
    std::fprintf(stderr, "%s: %s\n", type.fullName().data(), fault.c_str());
    std::abort();
  }
  return 0;
}

// Encodings written by hand, and what must become of them. The fuzzers start from them.
#pragma once

#include <cstddef>
#include <span>
#include <string_view>

#include <orv/decode_error.hpp>

namespace orv::test {

// Bytes are written as hex() reads them. Names of messages leave out the "orv.".

struct ReadCase {
  const char* name;
  std::string_view message;
  std::string_view input;
  std::string_view encodedAgain;
};
std::span<const ReadCase> readCases();

// What every message refuses, whether it is the first record, a later one, or stands in an unknown group. The
// offset is that within the case.
struct MalformedCase {
  const char* name;
  std::string_view input;
  DecodeCause cause;
  std::size_t offset;
};
std::span<const MalformedCase> malformedCases();

// What some message refuses, and the whole sentence that says so.
struct RefusedCase {
  const char* name;
  std::string_view message;
  std::string_view input;
  std::string_view error;
};
std::span<const RefusedCase> refusedCases();

}  // namespace orv::test

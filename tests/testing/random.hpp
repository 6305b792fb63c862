// Random choices that can be repeated.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <iostream>
#include <random>
#include <string>

namespace orv::test {

// Starts from the environment's ORV_TEST_SEED, or else from a new seed, and prints which.
class Random {
 public:
  Random() : Random(fromEnvironment("ORV_TEST_SEED", std::random_device()())) {}
  explicit Random(std::uint64_t seed) : engine_(seed) {
    std::cout << "random choices of ORV_TEST_SEED=" << seed << '\n';
  }

  // A number that the environment gives, or the other one.
  static std::uint64_t fromEnvironment(const char* name, std::uint64_t otherwise) {
    const char* const value = std::getenv(name);
    return value == nullptr ? otherwise : std::strtoull(value, nullptr, 10);
  }
  // How many rounds a random test runs: ORV_TEST_ROUNDS, or what the test gives.
  static std::size_t rounds(std::size_t enough) {
    return static_cast<std::size_t>(fromEnvironment("ORV_TEST_ROUNDS", enough));
  }

  std::uint64_t number() { return engine_(); }
  std::size_t below(std::size_t limit) { return static_cast<std::size_t>(engine_() % limit); }
  bool oneIn(std::size_t count) { return below(count) == 0; }
  const auto& pick(const auto& list) { return list[below(std::size(list))]; }
  // Small numbers and those around the powers of two are as likely as all the others.
  std::uint64_t edgyNumber() { return (engine_() >> below(64)) + below(3) - 1; }

  std::string bytes(std::size_t count) {
    std::string result(count, '\0');
    for (char& byte : result) byte = static_cast<char>(engine_());
    return result;
  }

 private:
  std::mt19937_64 engine_;
};

}  // namespace orv::test

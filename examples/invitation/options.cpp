#include "examples/invitation/options.hpp"

#include <array>
#include <charconv>
#include <cstddef>
#include <memory>
#include <utility>
#include <vector>

namespace invitation {

namespace {

Outcome<std::chrono::milliseconds> parseTimeLimit(std::string_view text) {
  constexpr double longest = 3600;
  double seconds = 0;
  const char* const end = std::to_address(text.end());
  const auto [stop, error] = std::from_chars(std::to_address(text.begin()), end, seconds);
  if (error != std::errc{} || stop != end || !(seconds > 0 && seconds <= longest)) {
    return failure("--time-limit takes a number of seconds up to 3600, not \"" + std::string(text) + "\"");
  }
  return std::chrono::ceil<std::chrono::milliseconds>(std::chrono::duration<double>(seconds));
}

Outcome<Misbehaviour> parseMisbehaviour(std::string_view text) {
  constexpr std::array<std::pair<std::string_view, Misbehaviour>, 4> known{{
      {"garbage", Misbehaviour::garbage},
      {"close", Misbehaviour::close},
      {"stall", Misbehaviour::stall},
      {"freeze", Misbehaviour::freeze},
  }};
  for (const auto& [name, misbehaviour] : known) {
    if (name == text) return misbehaviour;
  }
  return failure("--misbehave takes garbage, close, stall or freeze, not \"" + std::string(text) + "\"");
}

Outcome<story::Person> parseGuest(std::string_view name) {
  for (const story::Person& person : {story::anna, story::ben}) {
    if (person.name == name) return person;
  }
  return failure("a guest is anna or ben, not \"" + std::string(name) + "\"");
}

template <class T>
Outcome<> store(const Outcome<T>& parsed, T& option) {
  if (!parsed) return std::unexpected(parsed.error());
  option = *parsed;
  return {};
}

Outcome<> setOption(Options& options, std::string_view option, const std::string& value) {
  if (option == "--capture") {
    options.capturePath = value;
    return {};
  }
  if (option == "--time-limit") {
    return store(parseTimeLimit(value), options.timeLimit);
  }
  if (option == "--misbehave") {
    return store(parseMisbehaviour(value), options.misbehaviour);
  }
  return failure("there is no option " + std::string(option));
}

Outcome<> setPart(Options& options, const std::vector<std::string>& words) {
  if (words.empty()) return {};
  if (words[0] == "host" && words.size() == 2) {
    options.part = Options::Part::host;
  } else if (words[0] == "guest" && words.size() == 3) {
    options.part = Options::Part::guest;
    if (auto set = store(parseGuest(words[2]), options.guest); !set) return set;
  } else {
    return failure("that is no part to play; --help shows them");
  }
  options.socketPath = words[1];
  return {};
}

}  // namespace

Outcome<Options> parseOptions(std::span<const char* const> arguments) {
  Options options;
  std::vector<std::string> words;
  for (std::size_t at = 0; at < arguments.size(); ++at) {
    const std::string_view argument = arguments[at];
    if (!argument.starts_with("--")) {
      words.emplace_back(argument);
      continue;
    }
    if (at + 1 == arguments.size()) return failure(std::string(argument) + " takes a value");
    if (auto set = setOption(options, argument, arguments[++at]); !set) return std::unexpected(set.error());
  }
  if (auto set = setPart(options, words); !set) return std::unexpected(set.error());
  return options;
}

}  // namespace invitation

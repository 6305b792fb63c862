#include <orv/json/error.hpp>

#include <algorithm>

#include <orv/spelling/text_position.hpp>

namespace orv::json {

namespace {

constexpr std::size_t longestName = 64;

bool isPlain(std::string_view name) {
  return !name.empty() && name.size() <= longestName && std::ranges::all_of(name, [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
  });
}

}  // namespace

std::string memberStep(std::string_view name) {
  if (isPlain(name)) return "." + std::string(name);
  if (name.size() <= longestName) return "[\"" + std::string(name) + "\"]";
  return "[\"" + std::string(name.substr(0, spelling::characterStart(name, longestName))) + "…\"]";
}

std::string Error::message() const {
  if (!path.empty()) return path + ": " + reason;
  return spelling::TextError{reason, line, column}.message();
}

}  // namespace orv::json

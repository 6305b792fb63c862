#include <orv/json/error.hpp>

#include <algorithm>

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
  std::size_t end = longestName;
  while (end > 0 && (static_cast<unsigned char>(name[end]) & 0xC0) == 0x80) --end;  // between two characters
  return "[\"" + std::string(name.substr(0, end)) + "…\"]";
}

std::string Error::message() const {
  if (!path.empty()) return path + ": " + reason;
  return "line " + std::to_string(line) + ", column " + std::to_string(column) + ": " + reason;
}

}  // namespace orv::json

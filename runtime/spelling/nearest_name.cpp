#include <orv/spelling/nearest_name.hpp>

#include <algorithm>
#include <cstddef>

namespace orv::inline v0::spelling {

namespace {

char lowered(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

// How many characters must be put in, taken out or exchanged to make one name of the other (Levenshtein).
std::size_t distance(std::string_view from, std::string_view to) {
  std::vector<std::size_t> row(to.size() + 1);
  for (std::size_t j = 0; j < row.size(); ++j) row[j] = j;
  for (std::size_t i = 0; i < from.size(); ++i) {
    std::size_t diagonal = row[0];
    row[0] = i + 1;
    for (std::size_t j = 0; j < to.size(); ++j) {
      const std::size_t exchanged = diagonal + (lowered(from[i]) == lowered(to[j]) ? 0 : 1);
      diagonal = row[j + 1];
      row[j + 1] = std::min({exchanged, row[j] + 1, row[j + 1] + 1});
    }
  }
  return row.back();
}

}  // namespace

std::string suggestion(std::string_view name, std::span<const std::string_view> candidates) {
  constexpr std::size_t longestName = 100;
  if (name.size() > longestName) return {};
  std::string_view nearest;
  // A third of the characters may be wrong, and at least two.
  std::size_t limit = std::max<std::size_t>(2, name.size() / 3) + 1;
  for (const std::string_view candidate : candidates) {
    const std::size_t found = distance(name, candidate);
    if (found < limit && found < candidate.size()) {
      limit = found;
      nearest = candidate;
    }
  }
  return nearest.empty() ? std::string() : " (did you mean \"" + std::string(nearest) + "\"?)";
}

}  // namespace orv::spelling

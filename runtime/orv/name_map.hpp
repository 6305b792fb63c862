// The text names of a message's fields or of an enumeration's cases.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

namespace orv::inline v0 {

// Names by number: field numbers of a message, raw values of an enumeration. Every name is of the kind
// `same`: the text name is the JSON name too. A map is a view of a table that lasts as long as the program.
class NameMap {
 public:
  // A field number or a raw value, and its name.
  struct Entry {
    std::int64_t number;
    std::string_view name;
  };

  constexpr NameMap() = default;
  // The entries stand in ascending order of their numbers.
  constexpr explicit NameMap(std::span<const Entry> entries) : entries_(entries) {}

  constexpr std::span<const Entry> entries() const { return entries_; }

  // Both answer none for what the map does not hold, in time linear in its size.
  constexpr std::optional<std::string_view> name(std::int64_t number) const {
    for (const Entry& entry : entries_) {
      if (entry.number == number) return entry.name;
    }
    return std::nullopt;
  }
  constexpr std::optional<std::int64_t> number(std::string_view name) const {
    for (const Entry& entry : entries_) {
      if (entry.name == name) return entry.number;
    }
    return std::nullopt;
  }

 private:
  std::span<const Entry> entries_;
};

}  // namespace orv

#include <orv/compare/leaf.hpp>

#include <algorithm>
#include <span>

#include <orv/byte_view.hpp>

namespace orv::compare {

std::string Leaf::path() const {
  std::string path;
  for (const Step& step : place) {
    if (!path.empty()) path += '.';
    path += step.name;
    if (step.isInList) path += '[' + std::to_string(step.index) + ']';
  }
  return path;
}

bool Leaf::isIn(const Leaf& message) const {
  return place.size() > message.place.size() &&
         std::ranges::equal(message.place, std::span(place).first(message.place.size()));
}

LeafCollector::Result LeafCollector::visitUnknownFields(const UnknownStorage& unknownFields) {
  std::size_t index = 0;
  for (const UnknownField& field : unknownFields) {
    const std::string bytes(charactersOf(field.record));
    addAt({Step::unknownFields, index++, true, "unknownFields"}, UnknownRecord{bytes});
  }
  return {};
}

}  // namespace orv::compare

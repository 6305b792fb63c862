#include <orv/compare.hpp>

#include <algorithm>
#include <cstddef>
#include <string_view>
#include <variant>

#include <orv/byte_view.hpp>
#include <orv/spelling/text_position.hpp>
#include <orv/spelling/value_text.hpp>

namespace orv::inline v0::compare {

namespace {

// Bytes that are readable text are shown as such.
std::string bytesText(std::string_view bytes, std::size_t from) {
  return !bytes.empty() && spelling::isReadable(bytes) ? spelling::quotedText(bytes, from)
                                                       : spelling::hexText(bytes, from);
}

// How a leaf's value reads, from a byte of it on.
struct ValueReader {
  std::size_t from = 0;

  std::string operator()(MessagePresence) const { return "{}"; }
  std::string operator()(const Text& text) const { return spelling::quotedText(text.utf8(), from); }
  std::string operator()(const ByteBuffer& bytes) const { return bytesText(bytes.characters(), from); }
  std::string operator()(bool flag) const { return flag ? "true" : "false"; }
  std::string operator()(std::uint32_t number) const { return std::to_string(number); }
  std::string operator()(const EnumerationValue& value) const {
    return value.name.empty() ? std::to_string(value.rawValue) : std::string(value.name);
  }
  std::string operator()(const UnknownRecord& record) const { return spelling::hexText(record.bytes, from); }
};

// The bytes of a value that may be long.
std::string_view contentOf(const Leaf& leaf) {
  if (const auto* const text = std::get_if<Text>(&leaf.value)) return text->utf8();
  if (const auto* const bytes = std::get_if<ByteBuffer>(&leaf.value)) return bytes->characters();
  if (const auto* const record = std::get_if<UnknownRecord>(&leaf.value)) return record->bytes;
  return {};
}

// From where on two values are to be shown: their beginning, or a little before they differ.
std::size_t interestingFrom(std::string_view before, std::string_view after) {
  constexpr std::size_t short_ = 32;
  constexpr std::size_t context = 8;
  const auto mismatch = std::ranges::mismatch(before, after);
  const auto common = static_cast<std::size_t>(mismatch.in1 - before.begin());
  if (common < short_) return 0;
  return spelling::characterStart(before, common - context);
}

std::string textOf(const Leaf& leaf, std::size_t from = 0) {
  return std::visit(ValueReader{from}, leaf.value);
}

Difference changed(const Leaf& before, const Leaf& after) {
  const std::size_t from = interestingFrom(contentOf(before), contentOf(after));
  return {Difference::Kind::changed, before.path(), textOf(before, from), textOf(after, from)};
}

// Whether the first leaf is a message that something stands in, which says more.
bool hasContents(std::span<const Leaf> leaves) { return leaves.size() > 1 && leaves[1].isIn(leaves[0]); }

}  // namespace

std::string Leaf::path() const {
  std::string path;
  for (const Step& step : place) {
    if (!path.empty()) path += '.';
    path += step.name;
    if (step.index) path += '[' + std::to_string(*step.index) + ']';
  }
  return path;
}

bool Leaf::isIn(const Leaf& message) const {
  return place.size() > message.place.size() &&
         std::ranges::equal(message.place, std::span(place).first(message.place.size()));
}

LeafCollector::Result LeafCollector::visitUnknownFields(const UnknownStorage& unknownFields) {
  return visitItems(unknownFields, [&](const UnknownField& field) {
    return add(Step::unknownFields, UnknownRecord{std::string(charactersOf(field.record))});
  });
}

std::vector<Difference> differencesOfLeaves(std::span<const Leaf> left, std::span<const Leaf> right) {
  std::vector<Difference> list;
  while (!left.empty() || !right.empty()) {
    const bool isLeftOnly = right.empty() || (!left.empty() && left[0].place < right[0].place);
    const bool isRightOnly = left.empty() || (!right.empty() && right[0].place < left[0].place);
    if (isLeftOnly && !hasContents(left)) {
      list.push_back({Difference::Kind::removed, left[0].path(), textOf(left[0]), {}});
    } else if (isRightOnly && !hasContents(right)) {
      list.push_back({Difference::Kind::added, right[0].path(), {}, textOf(right[0])});
    } else if (!isLeftOnly && !isRightOnly && left[0].value != right[0].value) {
      list.push_back(changed(left[0], right[0]));
    }
    if (!isRightOnly) left = left.subspan(1);
    if (!isLeftOnly) right = right.subspan(1);
  }
  return list;
}

}  // namespace orv::compare

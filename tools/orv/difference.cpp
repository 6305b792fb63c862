#include "tools/orv/difference.hpp"

#include <algorithm>
#include <cassert>
#include <cstddef>
#include <string_view>
#include <variant>

#include "tools/orv/value_text.hpp"

namespace orv::tool {

namespace {

// Bytes that are readable text are shown as such.
std::string bytesText(std::string_view bytes, std::size_t from) {
  return !bytes.empty() && isReadable(bytes) ? quotedText(bytes, from) : hexText(bytes, from);
}

// How a leaf's value reads, from a byte of it on.
struct ValueReader {
  std::size_t from = 0;

  std::string operator()(MessagePresence) const { return "{}"; }
  std::string operator()(const Text& text) const { return quotedText(text.utf8(), from); }
  std::string operator()(const ByteBuffer& bytes) const { return bytesText(bytes.characters(), from); }
  std::string operator()(bool flag) const { return flag ? "true" : "false"; }
  std::string operator()(std::uint32_t number) const { return std::to_string(number); }
  std::string operator()(const EnumerationValue& value) const {
    return value.name.empty() ? std::to_string(value.rawValue) : std::string(value.name);
  }
  std::string operator()(const UnknownRecord& record) const { return hexText(record.bytes, from); }
};

// The bytes of a value that may be long.
struct ContentReader {
  std::string_view operator()(const Text& text) const { return text.utf8(); }
  std::string_view operator()(const ByteBuffer& bytes) const { return bytes.characters(); }
  std::string_view operator()(const UnknownRecord& record) const { return record.bytes; }
  template <class Other>
  std::string_view operator()(const Other&) const {
    return {};
  }
};

// From where on two values are to be shown: their beginning, or a little before they differ.
std::size_t interestingFrom(std::string_view before, std::string_view after) {
  constexpr std::size_t short_ = 32;
  constexpr std::size_t context = 8;
  const auto mismatch = std::ranges::mismatch(before, after);
  const auto common = static_cast<std::size_t>(mismatch.in1 - before.begin());
  if (common < short_) return 0;
  std::size_t from = common - context;
  while (from > 0 && (static_cast<unsigned char>(before[from]) & 0xC0) == 0x80)
    --from;  // between two characters
  return from;
}

Difference changed(const Leaf& before, const Leaf& after) {
  const std::size_t from =
      interestingFrom(std::visit(ContentReader(), before.value), std::visit(ContentReader(), after.value));
  return {Difference::Kind::changed, before.path(), std::visit(ValueReader{from}, before.value),
          std::visit(ValueReader{from}, after.value)};
}

// Whether the leaf at `index` is a message that something stands in, which says more.
bool hasContents(const std::vector<Leaf>& leaves, std::size_t index) {
  return index + 1 < leaves.size() && leaves[index + 1].isIn(leaves[index]);
}

}  // namespace

std::vector<Difference> differences(const MessageValue& before, const MessageValue& after) {
  std::vector<Difference> list;
  if (before.isEqualTo(after)) return list;
  const std::vector<Leaf> left = before.leaves();
  const std::vector<Leaf> right = after.leaves();
  std::size_t leftAt = 0;
  std::size_t rightAt = 0;
  while (leftAt < left.size() || rightAt < right.size()) {
    const bool leftOnly =
        rightAt == right.size() || (leftAt < left.size() && left[leftAt].place < right[rightAt].place);
    const bool rightOnly =
        leftAt == left.size() || (rightAt < right.size() && right[rightAt].place < left[leftAt].place);
    if (leftOnly) {
      const Leaf& leaf = left[leftAt];
      if (!hasContents(left, leftAt++)) {
        list.push_back({Difference::Kind::removed, leaf.path(), std::visit(ValueReader(), leaf.value), {}});
      }
    } else if (rightOnly) {
      const Leaf& leaf = right[rightAt];
      if (!hasContents(right, rightAt++)) {
        list.push_back({Difference::Kind::added, leaf.path(), {}, std::visit(ValueReader(), leaf.value)});
      }
    } else {
      if (left[leftAt].value != right[rightAt].value) list.push_back(changed(left[leftAt], right[rightAt]));
      ++leftAt;
      ++rightAt;
    }
  }
  assert(!list.empty());
  return list;
}

}  // namespace orv::tool

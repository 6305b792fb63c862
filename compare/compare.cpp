#include <orv/compare.hpp>

#include <algorithm>
#include <cstddef>
#include <string_view>
#include <variant>

#include <orv/byte_view.hpp>
#include <orv/hasher.hpp>
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

// Feeds a leaf's value into the hashes of an item: of the shape, what kind of value it is.
struct KeyMaker {
  Hasher& contents;
  Hasher& shape;

  void operator()(MessagePresence message) const { combine(contents, shape, message.type); }
  void operator()(const EnumerationValue& value) const {
    combine(contents, shape, static_cast<std::uint64_t>(value.rawValue));
  }
  void operator()(const UnknownRecord& record) const { contents.combine(record.bytes); }
  void operator()(const Text& text) const { text.hash(contents); }
  void operator()(const ByteBuffer& bytes) const { bytes.hash(contents); }
  void operator()(std::uint32_t number) const { contents.combine(std::uint64_t{number}); }

 private:
  template <class T>
  static void combine(Hasher& contents, Hasher& shape, T value) {
    contents.combine(value);
    shape.combine(value);
  }
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

using Leaves = std::span<const Leaf>;

bool isMessage(const Leaf& leaf) { return std::holds_alternative<MessagePresence>(leaf.value); }

// How many leaves, from the first on, satisfy a condition that those behind them do not.
template <class Condition>
Leaves leading(Leaves leaves, Condition condition) {
  return {leaves.begin(), std::ranges::find_if_not(leaves, condition)};
}

// The leaves of one value: the first, and what is in it.
Leaves firstValue(Leaves leaves) {
  return leaves.first(
      1 + leading(leaves.subspan(1), [&](const Leaf& leaf) { return leaf.isIn(leaves[0]); }).size());
}

// Cut off the front.
Leaves take(Leaves& leaves, Leaves taken) {
  leaves = leaves.subspan(taken.size());
  return taken;
}

void appendSummary(Leaves value, std::string& output) {
  constexpr std::size_t longest = 100;  // bytes, more or less
  if (!isMessage(value[0])) {
    output += textOf(value[0]);
    return;
  }
  output += '{';
  const std::size_t step = value[0].place.size();
  for (Leaves rest = value.subspan(1); !rest.empty();) {
    if (!output.ends_with('{')) output += ", ";
    if (output.size() > longest) {
      output += "…";
      break;
    }
    output += rest[0].place[step].name;
    output += ": ";
    appendSummary(take(rest, firstValue(rest)), output);
  }
  output += '}';
}

// Goes down two trees of leaves side by side. Both are in the order of their places.
class TreeComparison {
 public:
  // The fields of one message, whose place has so many steps.
  void compareFields(Leaves before, Leaves after, std::size_t depth) {
    while (!before.empty() || !after.empty()) {
      const auto number = [&](Leaves leaves) {
        return leaves.empty() ? std::uint64_t{1} << 32 : leaves[0].place[depth].number;
      };
      const std::uint64_t first = std::min(number(before), number(after));
      const auto isOfField = [&](const Leaf& leaf) { return leaf.place[depth].number == first; };
      const Leaves left = take(before, leading(before, isOfField));
      const Leaves right = take(after, leading(after, isOfField));
      if (const Leaf& any = left.empty() ? right[0] : left[0]; any.place[depth].index) {
        compareLists(left, right, depth);
      } else {
        compareValues(left, right, depth);
      }
    }
  }

  std::vector<Difference> found() && { return std::move(list_); }

 private:
  using Kind = Difference::Kind;

  void compareValues(Leaves before, Leaves after, std::size_t depth) {
    if (before.empty() || after.empty())
      return before.empty() ? addContents(Kind::added, after) : addContents(Kind::removed, before);
    const bool isSame = before[0].value == after[0].value;
    if (isSame) return compareFields(before.subspan(1), after.subspan(1), depth + 1);
    list_.push_back(changed(before[0], after[0]));
    // Messages of different types have no fields in common, whatever their numbers.
    addContents(Kind::removed, before.subspan(1));
    addContents(Kind::added, after.subspan(1));
  }

  void compareLists(Leaves before, Leaves after, std::size_t depth) {
    const auto left = itemsOf(before);
    const auto right = itemsOf(after);
    const auto keysOf = [&](const std::vector<Leaves>& items) {
      std::vector<AlignmentKey> keys;
      keys.reserve(items.size());
      for (const Leaves item : items) keys.push_back(keyOf(item, depth + 1));
      return keys;
    };
    for (const auto& [old, now] : align(keysOf(left), keysOf(right))) {
      if (old && now) {
        compareValues(left[*old], right[*now], depth);
      } else {
        add(old ? Kind::removed : Kind::added, old ? left[*old] : right[*now]);
      }
    }
  }

  static std::vector<Leaves> itemsOf(Leaves list) {
    std::vector<Leaves> items;
    while (!list.empty()) items.push_back(take(list, firstValue(list)));
    return items;
  }

  static Difference changed(const Leaf& before, const Leaf& after) {
    const std::size_t from = interestingFrom(contentOf(before), contentOf(after));
    // What is a message on one side alone, or on both of another type, is told by its type.
    const auto text = [&](const Leaf& leaf) {
      const auto* const message = std::get_if<MessagePresence>(&leaf.value);
      return message != nullptr ? std::string(message->type) : textOf(leaf, from);
    };
    return {Kind::changed, before.path(), text(before), text(after)};
  }

  // Value by value; an item of a list is one, whatever it holds.
  void addContents(Kind kind, Leaves leaves) {
    while (!leaves.empty()) {
      const Leaves value = firstValue(leaves);
      const bool hasContents = value.size() > 1 && !value[0].place.back().index;
      if (!hasContents) add(kind, value);
      leaves = leaves.subspan(hasContents ? 1 : value.size());
    }
  }

  void add(Kind kind, Leaves value) {
    Difference difference{kind, value[0].path(), {}, {}};
    (kind == Kind::removed ? difference.before : difference.after) = summaryOf(value);
    list_.push_back(std::move(difference));
  }

  std::vector<Difference> list_;
};

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

bool Leaf::isAt(std::string_view path) const {
  for (const Step& step : place) {
    if (!path.starts_with(step.name)) return false;
    path.remove_prefix(step.name.size());
    const std::string index = step.index ? '[' + std::to_string(*step.index) + ']' : "";
    if (path.starts_with('[')) {
      if (index.empty() || !path.starts_with(index)) return false;
      path.remove_prefix(index.size());
    }
    if (path.empty()) return true;
    if (!path.starts_with('.')) return false;
    path.remove_prefix(1);
  }
  return false;
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

AlignmentKey keyOf(std::span<const Leaf> leaves, std::size_t depth) {
  Hasher contents;
  Hasher shape;
  for (const Leaf& leaf : leaves) {
    for (const Step& step : std::span(leaf.place).subspan(depth)) {
      contents.combine(step.number);
      contents.combine(step.index.value_or(0));
      shape.combine(step.number);
    }
    std::visit(KeyMaker{contents, shape}, leaf.value);
  }
  return {contents.finish(), shape.finish()};
}

std::string summaryOf(std::span<const Leaf> value) {
  std::string text;
  appendSummary(value, text);
  return text;
}

std::vector<Difference> differencesOfLeaves(std::span<const Leaf> before, std::span<const Leaf> after) {
  TreeComparison comparison;
  comparison.compareFields(before, after, 0);
  return std::move(comparison).found();
}

}  // namespace orv::inline v0::compare

#include <orv/compare/alignment.hpp>

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace orv::inline v0::compare {

namespace {

using Keys = std::span<const AlignmentKey>;
using Key = std::uint64_t AlignmentKey::*;

// A point in the edit graph: so many items of each list are behind it.
struct Point {
  std::ptrdiff_t x;
  std::ptrdiff_t y;
};

// One stretch of edits. Row d of `reached_` says how far d edits get on each diagonal x - y = -d, -d + 2 … d.
class Stretch {
 public:
  Stretch(Keys before, Keys after, Key key) : before_(before), after_(after), key_(key) {}

  // Appends the equal items, ascending, and answers where the stretch ends: behind the last item of both lists, or
  // as far as so many edits get.
  Point appendMatches(std::vector<Point>& matches) {
    constexpr std::ptrdiff_t mostEdits = 256;
    const Point last{std::ssize(before_), std::ssize(after_)};
    Point end{0, 0};
    std::ptrdiff_t edits = 0;
    for (std::ptrdiff_t d = 0; d <= mostEdits && end.x + end.y != last.x + last.y; ++d) {
      reached_.emplace_back(static_cast<std::size_t>(d) + 1);
      for (std::ptrdiff_t k = -d; k <= d; k += 2) {
        const Point point = slide(start(d, k));
        reached_.back()[static_cast<std::size_t>((k + d) / 2)] = point.x;
        const bool isInside = point.x <= last.x && point.y <= last.y;
        if (isInside && isFurther(point, end)) {
          end = point;
          edits = d;
        }
      }
    }
    appendPath(end, edits, matches);
    return end;
  }

 private:
  static bool isFurther(Point point, Point than) {
    return std::pair(point.x + point.y, -std::abs(point.x - point.y)) >
           std::pair(than.x + than.y, -std::abs(than.x - than.y));
  }
  std::ptrdiff_t reached(std::ptrdiff_t d, std::ptrdiff_t k) const {
    return reached_[static_cast<std::size_t>(d)][static_cast<std::size_t>((k + d) / 2)];
  }
  // Where the last of d edits ends on the diagonal, and from which diagonal it came.
  std::ptrdiff_t diagonalBefore(std::ptrdiff_t d, std::ptrdiff_t k) const {
    return k == -d || (k != d && reached(d - 1, k - 1) < reached(d - 1, k + 1)) ? k + 1 : k - 1;
  }
  Point start(std::ptrdiff_t d, std::ptrdiff_t k) const {
    if (d == 0) return {0, 0};
    const std::ptrdiff_t from = diagonalBefore(d, k);
    const std::ptrdiff_t x = reached(d - 1, from) + (from < k ? 1 : 0);
    return {x, x - k};
  }
  Point slide(Point point) const {
    while (point.x < std::ssize(before_) && point.y < std::ssize(after_) &&
           before_[static_cast<std::size_t>(point.x)].*key_ ==
               after_[static_cast<std::size_t>(point.y)].*key_) {
      ++point.x;
      ++point.y;
    }
    return point;
  }
  void appendPath(Point end, std::ptrdiff_t edits, std::vector<Point>& matches) const {
    const auto first = std::ssize(matches);
    for (std::ptrdiff_t d = edits; d >= 0; --d) {
      const std::ptrdiff_t k = end.x - end.y;
      for (const std::ptrdiff_t from = start(d, k).x; end.x > from;) matches.push_back({--end.x, --end.y});
      if (d == 0) break;
      const std::ptrdiff_t before = diagonalBefore(d, k);
      end = {reached(d - 1, before), reached(d - 1, before) - before};
    }
    std::reverse(matches.begin() + first, matches.end());
  }

  Keys before_;
  Keys after_;
  Key key_;
  std::vector<std::vector<std::ptrdiff_t>> reached_;
};

std::vector<Point> matches(Keys before, Keys after, Key key) {
  std::vector<Point> list;
  Point origin{0, 0};
  while (origin.x != std::ssize(before) && origin.y != std::ssize(after)) {
    const auto first = list.size();
    const Point end = Stretch(before.subspan(static_cast<std::size_t>(origin.x)),
                              after.subspan(static_cast<std::size_t>(origin.y)), key)
                          .appendMatches(list);
    for (auto at = first; at < list.size(); ++at) list[at] = {list[at].x + origin.x, list[at].y + origin.y};
    origin = {origin.x + end.x, origin.y + end.y};
  }
  return list;
}

class Alignment {
 public:
  Alignment(Keys before, Keys after) : before_(before), after_(after) {}

  // Up to, and without, these places; the keys that are still to be tried are of such number.
  void alignUpTo(Point end, std::span<const Key> keys) {
    if (!keys.empty()) {
      const auto first = static_cast<std::size_t>(next_.x);
      const auto second = static_cast<std::size_t>(next_.y);
      const Point origin = next_;
      for (const Point match :
           matches(before_.subspan(first, static_cast<std::size_t>(end.x) - first),
                   after_.subspan(second, static_cast<std::size_t>(end.y) - second), keys.front())) {
        alignUpTo({origin.x + match.x, origin.y + match.y}, keys.subspan(1));
        add(true, true);
      }
      return alignUpTo(end, keys.subspan(1));
    }
    while (next_.x < end.x || next_.y < end.y) add(next_.x < end.x, next_.y < end.y);
  }

  std::vector<AlignedPair> take() { return std::move(pairs_); }

 private:
  void add(bool hasBefore, bool hasAfter) {
    AlignedPair& pair = pairs_.emplace_back();
    if (hasBefore) pair.before = static_cast<std::size_t>(next_.x++);
    if (hasAfter) pair.after = static_cast<std::size_t>(next_.y++);
  }

  Keys before_;
  Keys after_;
  Point next_{0, 0};
  std::vector<AlignedPair> pairs_;
};

}  // namespace

std::vector<AlignedPair> align(std::span<const AlignmentKey> before, std::span<const AlignmentKey> after) {
  constexpr Key keys[] = {&AlignmentKey::contents, &AlignmentKey::shape};
  Alignment alignment(before, after);
  alignment.alignUpTo({std::ssize(before), std::ssize(after)}, keys);
  return alignment.take();
}

}  // namespace orv::inline v0::compare

#include "canonical.hpp"

#include <utf8proc.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <numeric>
#include <span>

#include <orv/utf8.hpp>

namespace orv::inline v0 {

namespace {

std::size_t combiningClass(char32_t codePoint) {
  return static_cast<std::size_t>(
      utf8proc_get_property(static_cast<utf8proc_int32_t>(codePoint))->combining_class);
}

// The longest canonical decomposition of one code point has four (U+1F82, for one); utf8proc says if it needs
// more.
void appendDecomposition(char32_t codePoint, std::vector<char32_t>& output) {
  std::array<utf8proc_int32_t, 8> parts{};
  int boundClass = 0;
  const utf8proc_ssize_t count = utf8proc_decompose_char(
      static_cast<utf8proc_int32_t>(codePoint), parts.data(), parts.size(),
      static_cast<utf8proc_option_t>(UTF8PROC_STABLE | UTF8PROC_DECOMPOSE), &boundClass);
  const auto kept = static_cast<std::size_t>(std::clamp<utf8proc_ssize_t>(count, 0, parts.size()));
  for (std::size_t at = 0; at < kept; ++at) output.push_back(static_cast<char32_t>(parts[at]));
}

// A stable sort by combining class, in linear time however long the run: by counting, as there are 256
// classes.
void orderRun(std::span<char32_t> run) {
  std::array<std::size_t, 257> starts{};
  for (const char32_t mark : run) ++starts[combiningClass(mark) + 1];
  std::partial_sum(starts.begin(), starts.end(), starts.begin());
  std::vector<char32_t> ordered(run.size());
  for (const char32_t mark : run) ordered[starts[combiningClass(mark)]++] = mark;
  std::ranges::copy(ordered, run.begin());
}

// The canonical ordering of D108 and D109: inside each run of marks, by combining class, equal classes in
// place. The usual exchange of neighbours takes quadratic time on a long run.
void orderMarks(std::vector<char32_t>& codePoints) {
  const auto isMark = [](char32_t codePoint) { return codePoint >= 0x300 && combiningClass(codePoint) != 0; };
  const auto byClass = [](char32_t left, char32_t right) {
    return combiningClass(left) < combiningClass(right);
  };
  for (auto run = codePoints.begin();;) {
    run = std::find_if(run, codePoints.end(), isMark);
    if (run == codePoints.end()) return;
    const auto runEnd = std::find_if_not(run, codePoints.end(), isMark);
    if (!std::is_sorted(run, runEnd, byClass)) orderRun(std::span(run, runEnd));
    run = runEnd;
  }
}

// libstdc++ 12 orders the vectors themselves by a quarter of their bytes where the highest byte comes first.
std::u32string_view asString(const std::vector<char32_t>& codePoints) {
  return {codePoints.data(), codePoints.size()};
}

}  // namespace

std::vector<char32_t> canonicalDecomposition(std::string_view utf8) {
  std::vector<char32_t> output;
  output.reserve(utf8.size());
  for (std::size_t at = 0; at < utf8.size();) {
    if (const auto byte = static_cast<unsigned char>(utf8[at]); byte < 0x80) {
      output.push_back(byte);
      ++at;
      continue;
    }
    const utf8::Step next = utf8::step(utf8.substr(at));
    appendDecomposition(next.codePoint, output);
    at += next.length;
  }
  orderMarks(output);
  return output;
}

std::strong_ordering canonicalOrder(std::string_view left, std::string_view right) {
  // What both share up to an ASCII character may be left out: no mark is ordered across it and nothing
  // composes with what stands before it.
  auto shared = static_cast<std::size_t>(std::ranges::mismatch(left, right).in1 - left.begin());
  while (shared > 0 && static_cast<unsigned char>(left[shared - 1]) >= 0x80) --shared;
  if (shared > 0) --shared;
  left.remove_prefix(shared);
  right.remove_prefix(shared);
  if (utf8::isAscii(left) && utf8::isAscii(right)) return left <=> right;
  return asString(canonicalDecomposition(left)) <=> asString(canonicalDecomposition(right));
}

}  // namespace orv

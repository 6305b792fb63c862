#include <orv/text.hpp>

#include <algorithm>
#include <string>
#include <vector>

#include <orv/utf8.hpp>
#include "canonical.hpp"

namespace orv::inline v0 {

Text::Text(std::string_view utf8) {
  if (utf8.size() <= internal::InlineBytes::inlineCapacity && bytes_.assignShortText(utf8)) return;
  std::size_t wellFormed = utf8::wellFormedPrefix(utf8);
  if (wellFormed == utf8.size()) [[likely]] {
    bytes_.assign(utf8);
    return;
  }
  constexpr std::string_view replacement = "\xEF\xBF\xBD";
  for (;; wellFormed = utf8::wellFormedPrefix(utf8)) {
    bytes_.append(utf8.substr(0, wellFormed));
    utf8.remove_prefix(wellFormed);
    if (utf8.empty()) break;
    bytes_.append(replacement);
    utf8.remove_prefix(utf8::step(utf8).length);
  }
}

std::expected<Text, IllFormedText> Text::checked(std::string_view utf8) {
  const std::size_t wellFormed = utf8::wellFormedPrefix(utf8);
  if (wellFormed != utf8.size()) return std::unexpected(IllFormedText{wellFormed});
  Text text;
  text.bytes_.assign(utf8);
  return text;
}

std::string IllFormedText::message() const { return "ill-formed UTF-8 at byte " + std::to_string(offset); }

void Text::hash(Hasher& into) const {
  const std::string_view bytes = utf8();
  if (utf8::isAscii(bytes)) {
    into.combine(bytes);
    return;
  }
  // Equal texts have one decomposition. One that is ASCII (of a Kelvin sign, say) is fed as an ASCII text is.
  const std::vector<char32_t> decomposition = canonicalDecomposition(bytes);
  if (std::ranges::all_of(decomposition, [](char32_t codePoint) { return codePoint < 0x80; })) {
    into.combine(std::string_view(std::string(decomposition.begin(), decomposition.end())));
  } else {
    const auto* const start = reinterpret_cast<const char*>(decomposition.data());
    into.combine(std::string_view(start, decomposition.size() * sizeof(char32_t)));
  }
}

std::weak_ordering Text::canonicalOrder(std::string_view left, std::string_view right) {
  return orv::canonicalOrder(left, right);
}

}  // namespace orv

#include <orv/spelling/value_text.hpp>

#include <utf8proc.h>

#include <algorithm>

#include <orv/spelling/hex.hpp>
#include <orv/utf8.hpp>

namespace orv::inline v0::spelling {

namespace {

// Whether a terminal shows the character, in its place, and does nothing else. Not so controls, line
// separators, what turns the direction of writing, and what is not seen (Unicode's Default_Ignorable_Code_Point).
bool isShown(const utf8::Step& step) {
  if (!step.isWellFormed) return false;
  if (step.codePoint < 0x7F) return step.codePoint >= 0x20;
  const auto& property = *utf8proc_get_property(static_cast<utf8proc_int32_t>(step.codePoint));
  switch (property.category) {
    case UTF8PROC_CATEGORY_CC:
    case UTF8PROC_CATEGORY_CF:
    case UTF8PROC_CATEGORY_ZL:
    case UTF8PROC_CATEGORY_ZP: return false;
    default: return !property.ignorable;
  }
}

// What stands at the start of the text, as it is or in escapes. Answers how many bytes it takes.
std::size_t appendCharacter(std::string_view text, std::string& output) {
  if (const char first = text.front(); first >= 0x20 && first < 0x7F) {
    output += first;
    return 1;
  }
  const utf8::Step step = utf8::step(text);
  const std::string_view character = text.substr(0, step.length);
  if (isShown(step)) {
    output += character;
  } else {
    output += "\\x";
    appendHex(character, output, "\\x");
  }
  return step.length;
}

std::size_t columnsOf(const utf8::Step& step) {
  if (!step.isWellFormed) return 1;
  return static_cast<std::size_t>(
      std::max(0, utf8proc_charwidth(static_cast<utf8proc_int32_t>(step.codePoint))));
}

std::string sizeNote(std::size_t size) { return " (" + std::to_string(size) + " bytes)"; }

}  // namespace

bool isReadable(std::string_view bytes) {
  while (!bytes.empty()) {
    const utf8::Step step = utf8::step(bytes);
    if (!isShown(step)) return false;
    bytes.remove_prefix(step.length);
  }
  return true;
}

std::string printable(std::string_view text) {
  std::string output;
  while (!text.empty()) text.remove_prefix(appendCharacter(text, output));
  return output;
}

std::size_t columns(std::string_view utf8) {
  if (utf8::isAscii(utf8)) return utf8.size();
  std::size_t count = 0;
  for (; !utf8.empty(); utf8.remove_prefix(utf8::step(utf8).length)) count += columnsOf(utf8::step(utf8));
  return count;
}

std::string_view startWithin(std::string_view utf8, std::size_t room) {
  if (utf8.size() <= room) return utf8;
  std::size_t end = 0;
  while (end < utf8.size()) {
    const utf8::Step step = utf8::step(utf8.substr(end));
    const std::size_t width = columnsOf(step);
    if (width > room) break;
    room -= width;
    end += step.length;
  }
  return utf8.substr(0, end);
}

void appendQuotedText(std::string_view utf8, std::string& output, std::size_t from) {
  constexpr std::size_t longest = 60;  // bytes
  const std::size_t size = utf8.size();
  output += from == 0 ? "\"" : "…\"";
  utf8.remove_prefix(from);
  std::size_t taken = 0;
  while (taken < utf8.size() && taken < longest) {
    if (utf8[taken] == '"' || utf8[taken] == '\\') output += '\\';
    taken += appendCharacter(utf8.substr(taken), output);
  }
  const bool isCut = taken < utf8.size();
  output += isCut ? "\"…" : "\"";
  if (from != 0 || isCut) output += sizeNote(size);
}

std::string quotedText(std::string_view utf8, std::size_t from) {
  std::string output;
  appendQuotedText(utf8, output, from);
  return output;
}

std::string hexText(std::string_view bytes, std::size_t from) {
  constexpr std::size_t longest = 24;  // bytes
  if (bytes.empty()) return "no bytes";
  std::string output = from == 0 ? "" : "… ";
  appendHex(bytes.substr(from, longest), output, " ");
  const bool isCut = bytes.size() - from > longest;
  if (isCut) output += " …";
  return from != 0 || isCut ? output + sizeNote(bytes.size()) : output;
}

}  // namespace orv::spelling

#include "tools/orv/value_text.hpp"

#include <algorithm>

#include <orv/utf8.hpp>

namespace orv::tool {

namespace {

constexpr std::size_t longestText = 60;  // bytes
constexpr std::size_t longestHex = 24;   // bytes

bool isControl(char32_t codePoint) { return codePoint < 0x20 || (codePoint >= 0x7F && codePoint < 0xA0); }

void appendHex(unsigned char byte, std::string& output) {
  output += "0123456789abcdef"[byte >> 4];
  output += "0123456789abcdef"[byte & 0xF];
}

std::string sizeNote(std::size_t size) { return " (" + std::to_string(size) + " bytes)"; }

}  // namespace

std::string hexOffset(std::uint64_t offset) {
  constexpr std::size_t fewest = 4;
  std::string digits;
  for (; offset != 0 || digits.size() < fewest; offset >>= 4) {
    digits.insert(digits.begin(), "0123456789abcdef"[offset & 0xF]);
  }
  return digits;
}

std::string bytePlace(std::uint64_t offset) {
  return "byte " + std::to_string(offset) + " (0x" + hexOffset(offset) + ")";
}

bool isReadable(std::string_view bytes) {
  while (!bytes.empty()) {
    const utf8::Step step = utf8::step(bytes);
    if (!step.isWellFormed || isControl(step.codePoint)) return false;
    bytes.remove_prefix(step.length);
  }
  return true;
}

std::string quotedText(std::string_view utf8, std::size_t from) {
  const std::size_t size = utf8.size();
  std::string output = from == 0 ? "\"" : "…\"";
  utf8.remove_prefix(from);
  std::size_t taken = 0;
  while (taken < utf8.size() && taken < longestText) {
    const utf8::Step step = utf8::step(utf8.substr(taken));
    const std::string_view character = utf8.substr(taken, step.length);
    if (character == "\"" || character == "\\") output += '\\';
    if (step.isWellFormed && !isControl(step.codePoint)) {
      output += character;
    } else {
      for (const char c : character) {
        output += "\\x";
        appendHex(static_cast<unsigned char>(c), output);
      }
    }
    taken += step.length;
  }
  output += taken < utf8.size() ? "\"…" : "\"";
  return from != 0 || taken < utf8.size() ? output + sizeNote(size) : output;
}

std::string hexText(std::string_view bytes, std::size_t from) {
  std::string output = from == 0 ? "" : "… ";
  const std::string_view shown = bytes.substr(from, longestHex);
  for (const char c : shown) {
    if (!output.empty() && &c != shown.data()) output += ' ';
    appendHex(static_cast<unsigned char>(c), output);
  }
  if (bytes.empty()) output += "no bytes";
  if (from + shown.size() < bytes.size()) output += " …";
  return from != 0 || shown.size() < bytes.size() ? output + sizeNote(bytes.size()) : output;
}

}  // namespace orv::tool

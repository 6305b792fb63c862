// Makes the dissector of its template, on standard input: the pairing of types and payloads in place of "@KINDS@".
#include <cstdio>
#include <string>

#include <orv/envelope.hpp>

namespace {

// One line for each type of envelopes: [5] = { name = "groupMessage", payload = "orv.Group" },
std::string kinds() {
  std::string lines;
  for (const auto& kind : orv::VessaSessionMessageType::_protobuf_nameMap().entries()) {
    lines += "  [" + std::to_string(kind.number) + "] = { name = \"" + std::string(kind.name) + '"';
    if (const auto* const payload = orv::envelope::payloadOf(orv::VessaSessionMessageType(kind.number)))
      lines += ", payload = \"" + std::string(payload->fullName) + '"';
    lines += " },\n";
  }
  return lines;
}

}  // namespace

int main() {
  std::string text;
  for (int character; (character = std::getchar()) != EOF;) text += static_cast<char>(character);
  const std::string place = "@KINDS@";
  const auto at = text.find(place);
  if (at == std::string::npos) return 1;
  text.replace(at, place.size(), kinds());
  return std::fwrite(text.data(), 1, text.size(), stdout) == text.size() ? 0 : 1;
}

// Prints what the dissector must know of the pairing of types and payloads.
#include <cstdio>
#include <string>

#include <orv/envelope.hpp>

int main() {
  std::string text =
      "-- What an envelope's type says of its data, made of the table of orv::envelope.\nlocal KINDS = {\n";
  for (const auto& kind : orv::VessaSessionMessageType::_protobuf_nameMap().entries()) {
    text += "  [" + std::to_string(kind.number) + "] = { name = \"" + std::string(kind.name) + '"';
    const auto* const payload = orv::envelope::payloadOf(orv::VessaSessionMessageType(kind.number));
    if (payload != nullptr) text += ", payload = \"" + std::string(payload->fullName) + '"';
    text += " },\n";
  }
  return std::puts((text + "}\n").c_str()) < 0 ? 1 : 0;
}

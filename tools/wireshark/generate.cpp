// Prints what the dissector must know of the messages and of the pairing of types and payloads.
#include <cstdio>
#include <string>

#include <orv/all_messages.hpp>
#include <orv/envelope.hpp>

namespace {

std::string quoted(std::string_view text) { return '"' + std::string(text) + '"'; }

std::string entry(std::int64_t number, const std::string& value) {
  return " [" + std::to_string(number) + "] = " + value + ",";
}

}  // namespace

int main() {
  std::string text =
      "-- What an envelope's type says of its data, made of the table of orv::envelope.\nlocal KINDS = {\n";
  for (const auto& kind : orv::VessaSessionMessageType::_protobuf_nameMap().entries()) {
    std::string names = "{ name = " + quoted(kind.name);
    const auto* const payload = orv::envelope::payloadOf(orv::VessaSessionMessageType(kind.number));
    if (payload != nullptr) names += ", payload = " + quoted(payload->fullName);
    text += ' ' + entry(kind.number, names + " }") + '\n';
  }
  text += "}\n-- The fields that hold messages or texts, by message.\nlocal MESSAGES = {\n";
  orv::AllMessages::forEach([&]<class M>() {
    text += "  [" + quoted(M::protoMessageName) + "] = {";
    for (const orv::FieldDescriptor& field : M::descriptor().fields) {
      if (field.type == orv::ValueType::message) text += entry(field.number, quoted(field.message->fullName));
      if (field.type == orv::ValueType::string) text += entry(field.number, quoted("string"));
    }
    text += " },\n";
  });
  return std::puts((text + "}\n").c_str()) < 0 ? 1 : 0;
}

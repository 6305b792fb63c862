// types and schema.
#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

#include <orv/envelope.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/messages/text_form.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {

namespace {

// "optional string", "oneof 1 Group.MemberAdded"
std::string describe(const FieldDescriptor& field) {
  std::string text;
  switch (field.kind) {
    case FieldKind::implicitPresence: break;
    case FieldKind::explicitPresence:
    case FieldKind::singularMessage: text = "optional "; break;
    case FieldKind::repeated: text = "repeated "; break;
    case FieldKind::oneofMember: text = "oneof " + std::to_string(field.oneof + 1) + ' '; break;
  }
  return text += field.message != nullptr ? typeOf(*field.message).shortName() : nameOf(field.type);
}

std::string describe(const MessageType& type) {
  std::string text(type.fullName());
  for (const auto& kind : VessaSessionMessageType::_protobuf_nameMap().entries()) {
    if (envelope::payloadOf(VessaSessionMessageType(kind.number)) == type.descriptor)
      text += "  (the payload of " + std::string(kind.name) + ")";
  }
  text += '\n';
  const auto fields = type.descriptor->fields;
  if (fields.empty()) text += "  no fields\n";
  std::size_t nameWidth = 0;
  for (const FieldDescriptor& field : fields) nameWidth = std::max(nameWidth, field.name.size());
  for (const FieldDescriptor& field : fields) {
    text += "  " + std::to_string(field.number) + "  " + std::string(field.name);
    text.append(nameWidth - field.name.size() + 2, ' ');
    text += describe(field) + '\n';
    std::string cases;
    for (const NameMap::Entry& entry : field.cases.entries()) {
      cases +=
          (cases.empty() ? "       " : ", ") + std::string(entry.name) + " = " + std::to_string(entry.number);
    }
    if (!cases.empty()) text += cases + '\n';
  }
  return text;
}

}  // namespace

ExitStatus runTypes(const Options& options) {
  std::vector<const MessageType*> types;
  for (const std::string& name : options.files) {
    const auto type = findMessageType(name);
    if (!type) {
      report({ExitStatus::usage, "orv: " + type.error()});
      return ExitStatus::usage;
    }
    types.push_back(*type);
  }
  if (types.empty()) {
    for (const MessageType& type : allMessageTypes()) types.push_back(&type);
  }
  std::string text;
  for (const MessageType* type : types) {
    if (!text.empty()) text += '\n';
    text += describe(*type);
  }
  return writeWhole(text);
}

ExitStatus runSchema(const Options&) { return writeWhole(schema()); }

}  // namespace orv::tool

// types and schema.
#include <algorithm>
#include <string>
#include <vector>

#include "tools/orv/commands.hpp"
#include "tools/orv/field_description.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/payload.hpp"
#include "tools/orv/schema.hpp"

namespace orv::tool {

namespace {

std::string describeType(const MessageType& type) {
  std::string text(type.fullName);
  if (const auto kind = kindCarrying(type); !kind.empty())
    text += "  (the payload of " + std::string(kind) + ")";
  text += '\n';
  const std::vector<FieldDescription> fields = describeFields(type);
  if (fields.empty()) text += "  no fields\n";
  std::size_t nameWidth = 0;
  for (const FieldDescription& field : fields) nameWidth = std::max(nameWidth, field.name.size());
  for (const FieldDescription& field : fields) {
    text += "  " + std::to_string(field.number) + "  " + std::string(field.name);
    text.append(nameWidth - field.name.size() + 2, ' ');
    if (!field.label.empty()) text += field.label + ' ';
    text += field.type + '\n';
    if (!field.cases.empty()) text += "       " + field.cases + '\n';
  }
  return text;
}

ExitStatus print(const Options& options, std::string_view text) {
  OutputFile output(options.output);
  auto written = output.write(text);
  if (written) written = output.finish();
  if (written) return ExitStatus::done;
  report(written.error());
  return written.error().status;
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
    text += describeType(*type);
  }
  return print(options, text);
}

ExitStatus runSchema(const Options& options) { return print(options, schema()); }

}  // namespace orv::tool

#include "tools/orv/text_schema.hpp"

#include <google/protobuf/compiler/parser.h>
#include <google/protobuf/io/tokenizer.h>
#include <google/protobuf/io/zero_copy_stream_impl_lite.h>

#include <cassert>
#include <map>
#include <string>

#include "tools/orv/schema.hpp"

namespace orv::tool {

namespace {

namespace pb = google::protobuf;

class NoErrors final : public pb::io::ErrorCollector {
 public:
  void AddError(int, pb::io::ColumnNumber, const std::string&) override {
    assert(false && "the shipped schema is well-formed");
  }
};

pb::FileDescriptorProto shippedFile() {
  const std::string_view source = schema();
  pb::io::ArrayInputStream input(source.data(), static_cast<int>(source.size()));
  NoErrors errors;
  pb::io::Tokenizer tokenizer(&input, &errors);
  pb::FileDescriptorProto file;
  pb::compiler::Parser().Parse(&tokenizer, &file);
  file.set_name("orv.proto");
  return file;
}

pb::FileDescriptorProto fileWithOpenData(const MessageType& payload) {
  pb::FileDescriptorProto file = shippedFile();
  for (pb::DescriptorProto& message : *file.mutable_message_type()) {
    if (file.package() + '.' + message.name() != SessionMessage::protoMessageName) continue;
    for (pb::FieldDescriptorProto& field : *message.mutable_field()) {
      if (field.name() != "data") continue;
      field.set_type(pb::FieldDescriptorProto::TYPE_MESSAGE);
      field.set_type_name('.' + std::string(payload.fullName));
    }
  }
  return file;
}

}  // namespace

TextSchema::TextSchema(const pb::FileDescriptorProto& file) {
  [[maybe_unused]] const pb::FileDescriptor* const built = pool_.BuildFile(file);
  assert(built != nullptr);
}

TextSchema& TextSchema::shipped() {
  static TextSchema& schema = *new TextSchema(shippedFile());
  return schema;
}

TextSchema& TextSchema::withOpenData(const MessageType& payload) {
  static auto& schemas = *new std::map<const MessageType*, std::unique_ptr<TextSchema>>();
  std::unique_ptr<TextSchema>& schema = schemas[&payload];
  if (schema == nullptr) schema = std::make_unique<TextSchema>(fileWithOpenData(payload));
  return *schema;
}

std::unique_ptr<pb::Message> TextSchema::newMessage(std::string_view fullName) {
  const pb::Descriptor* const descriptor = pool_.FindMessageTypeByName(std::string(fullName));
  assert(descriptor != nullptr);
  return std::unique_ptr<pb::Message>(factory_.GetPrototype(descriptor)->New());
}

}  // namespace orv::tool

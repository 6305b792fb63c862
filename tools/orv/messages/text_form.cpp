#include "tools/orv/messages/text_form.hpp"

#include <google/protobuf/compiler/parser.h>
#include <google/protobuf/descriptor.h>
#include <google/protobuf/descriptor.pb.h>
#include <google/protobuf/dynamic_message.h>
#include <google/protobuf/io/tokenizer.h>
#include <google/protobuf/io/zero_copy_stream_impl_lite.h>
#include <google/protobuf/message.h>
#include <google/protobuf/text_format.h>

#include <algorithm>
#include <cassert>
#include <map>
#include <memory>
#include <tuple>
#include <utility>

#include <orv/utf8.hpp>

namespace orv::tool {

namespace {

namespace pb = google::protobuf;

// Keeps the first error.
class FirstError final : public pb::io::ErrorCollector {
 public:
  void AddError(int line, pb::io::ColumnNumber column, const std::string& message) override {
    if (error_.has_value()) return;
    std::string reason = message;
    if (reason.ends_with('.')) reason.pop_back();
    error_ = {std::move(reason), static_cast<std::size_t>(line) + 1, static_cast<std::size_t>(column) + 1};
  }
  spelling::TextError error() const {
    return error_.value_or(spelling::TextError{"no message in the text format", 1, 1});
  }

 private:
  std::optional<spelling::TextError> error_;
};

pb::FileDescriptorProto shippedFile() {
  const std::string_view source = schema();
  pb::io::ArrayInputStream input(source.data(), static_cast<int>(source.size()));
  FirstError errors;  // none: the shipped schema is well-formed
  pb::io::Tokenizer tokenizer(&input, &errors);
  pb::FileDescriptorProto file;
  pb::compiler::Parser().Parse(&tokenizer, &file);
  file.set_name("orv.proto");
  return file;
}

// The message types of the shipped schema, or of one that differs from it in one thing: an envelope's data is
// a message of the payload's type. Made on first use, never freed.
class TextSchema {
 public:
  // The shipped one for no payload.
  static TextSchema& with(const MessageType* payload) {
    static auto& schemas = *new std::map<const MessageType*, TextSchema>();
    return schemas.try_emplace(payload, payload).first->second;
  }

  explicit TextSchema(const MessageType* payload) {
    pb::FileDescriptorProto file = shippedFile();
    for (pb::DescriptorProto& message : *file.mutable_message_type()) {
      const bool isEnvelope = file.package() + '.' + message.name() == SessionMessage::protoMessageName;
      if (payload == nullptr || !isEnvelope) continue;
      pb::FieldDescriptorProto& data = *std::ranges::find(*message.mutable_field(), "data", nameOfField);
      data.set_type(pb::FieldDescriptorProto::TYPE_MESSAGE);
      data.set_type_name('.' + std::string(payload->fullName()));
    }
    [[maybe_unused]] const pb::FileDescriptor* const built = pool_.BuildFile(file);
    assert(built != nullptr);
  }

  std::unique_ptr<pb::Message> newMessage(std::string_view fullName) {
    const pb::Descriptor* const descriptor = pool_.FindMessageTypeByName(std::string(fullName));
    assert(descriptor != nullptr);
    return std::unique_ptr<pb::Message>(factory_.GetPrototype(descriptor)->New());
  }

 private:
  static const std::string& nameOfField(const pb::FieldDescriptorProto& field) { return field.name(); }

  pb::DescriptorPool pool_;
  pb::DynamicMessageFactory factory_{&pool_};
};

struct ParsedText {
  std::unique_ptr<pb::Message> message;
  std::unique_ptr<pb::TextFormat::ParseInfoTree> locations;
};

enum class UnknownNames : bool { refuse, skip };

std::expected<ParsedText, spelling::TextError> parse(TextSchema& schema, std::string_view typeName,
                                                     std::string_view text, UnknownNames unknownNames) {
  constexpr int maximumNesting = 100;
  ParsedText parsed{schema.newMessage(typeName), std::make_unique<pb::TextFormat::ParseInfoTree>()};
  FirstError errors;
  pb::TextFormat::Parser parser;
  parser.RecordErrorsTo(&errors);
  parser.WriteLocationsTo(parsed.locations.get());
  parser.SetRecursionLimit(maximumNesting);
  parser.AllowUnknownField(unknownNames == UnknownNames::skip);
  if (!parser.ParseFromString(std::string(text), parsed.message.get()))
    return std::unexpected(errors.error());
  return parsed;
}

// A list in brackets is at one place, that of its first item.
spelling::TextError errorAt(const pb::TextFormat::ParseInfoTree& locations, const pb::FieldDescriptor& field,
                            int index, std::string reason) {
  auto place = locations.GetLocation(&field, index);
  for (; place.line < 0 && index > 0; --index) place = locations.GetLocation(&field, index - 1);
  return {std::move(reason), static_cast<std::size_t>(place.line + 1),
          static_cast<std::size_t>(place.column + 1)};
}

std::string textAt(const pb::Message& message, const pb::FieldDescriptor& field, int index) {
  const pb::Reflection& reflection = *message.GetReflection();
  return field.is_repeated() ? reflection.GetRepeatedString(message, &field, index)
                             : reflection.GetString(message, &field);
}

const pb::Message& messageAt(const pb::Message& message, const pb::FieldDescriptor& field, int index) {
  const pb::Reflection& reflection = *message.GetReflection();
  return field.is_repeated() ? reflection.GetRepeatedMessage(message, &field, index)
                             : reflection.GetMessage(message, &field);
}

using TextCheck = std::expected<void, spelling::TextError>;

TextCheck checkTexts(const pb::Message& message, const pb::TextFormat::ParseInfoTree& locations);

// Checks one value of a field: a text, or the texts in a message.
TextCheck checkValue(const pb::Message& message, const pb::FieldDescriptor& field, int index,
                     const pb::TextFormat::ParseInfoTree& locations) {
  const int place = field.is_repeated() ? index : -1;
  if (field.type() == pb::FieldDescriptor::TYPE_MESSAGE) {
    const auto* const nested = locations.GetTreeForNested(&field, place);
    return checkTexts(messageAt(message, field, index), nested != nullptr ? *nested : locations);
  }
  if (field.type() != pb::FieldDescriptor::TYPE_STRING) return {};
  if (utf8::isWellFormed(textAt(message, field, index))) return {};
  const std::string item = field.is_repeated() ? '[' + std::to_string(index) + ']' : "";
  return std::unexpected(errorAt(locations, field, place, "ill-formed UTF-8 in " + field.name() + item));
}

// The parser takes escapes of any bytes, also in texts, and says nothing.
TextCheck checkTexts(const pb::Message& message, const pb::TextFormat::ParseInfoTree& locations) {
  std::vector<const pb::FieldDescriptor*> fields;
  message.GetReflection()->ListFields(message, &fields);
  for (const pb::FieldDescriptor* field : fields) {
    const int count = field->is_repeated() ? message.GetReflection()->FieldSize(message, field) : 1;
    for (int index = 0; index < count; ++index) {
      if (auto checked = checkValue(message, *field, index, locations); !checked) return checked;
    }
  }
  return {};
}

std::expected<std::string, spelling::TextError> encode(
    std::expected<ParsedText, spelling::TextError> parsed) {
  if (!parsed) return std::unexpected(std::move(parsed.error()));
  if (auto checked = checkTexts(*parsed->message, *parsed->locations); !checked)
    return std::unexpected(checked.error());
  return parsed->message->SerializePartialAsString();
}

VessaSessionMessageType typeOfEnvelope(const pb::Message& envelope) {
  const pb::FieldDescriptor* const field = envelope.GetDescriptor()->FindFieldByName("type");
  return VessaSessionMessageType(envelope.GetReflection()->GetEnumValue(envelope, field));
}

bool isBefore(const spelling::TextError& left, const spelling::TextError& right) {
  return std::tie(left.line, left.column) < std::tie(right.line, right.column);
}

}  // namespace

std::expected<std::string, spelling::TextError> encodeTextForm(const MessageType& type, std::string_view text,
                                                               const PayloadPairing& payloads) {
  const auto parseClosed = [&] {
    return parse(TextSchema::with(nullptr), type.fullName(), text, UnknownNames::refuse);
  };
  if (!type.isEnvelope()) return encode(parseClosed());

  // First with a data that is some message, to see whether it is one, and which.
  auto seen =
      parse(TextSchema::with(&typeOf<ConnectionResponse>()), type.fullName(), text, UnknownNames::skip);
  if (!seen) {
    auto closed = parseClosed();
    // The reading that got further has the better reason.
    if (!closed && isBefore(closed.error(), seen.error())) return std::unexpected(seen.error());
    return encode(std::move(closed));
  }
  const pb::FieldDescriptor* const data = seen->message->GetDescriptor()->FindFieldByName("data");
  if (!seen->message->GetReflection()->HasField(*seen->message, data)) return encode(parseClosed());
  const MessageType* const payload = payloads.payloadOf(typeOfEnvelope(*seen->message));
  if (payload == nullptr) {
    return std::unexpected(errorAt(*seen->locations, *data, -1, "a message, but no \"type\" says which"));
  }
  return encode(parse(TextSchema::with(payload), type.fullName(), text, UnknownNames::refuse));
}

}  // namespace orv::tool

#include <orv/byte_view.hpp>
#include <orv/json/renderer.hpp>
#include <orv/spelling/base64.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/inspect/renderers.hpp"

namespace orv::tool {

namespace {

// A document for each message, and in a stream a line. Values are what the JSON mapping has.
class JsonRenderer final : public Renderer {
 public:
  JsonRenderer(const Options& options, std::string& output) : Renderer(output), options_(options) {}

  void beginMessage(const ExplainedMessage& message) override {
    add(R"({"file":)", spelling::printable(message.path));
    if (message.number != 0) add(R"(,"message":)", message.number);
    add(R"(,"type":)", message.type.fullName());
    add(R"(,"offset":)", message.offset);
    add(R"(,"length":)", message.bytes.size());
    output_ += R"(,"fields":[)";
    isFirst_ = true;
    message_ = &message;
  }

  void record(const ExplainedRecord& explained) override {
    const TracedRecord& record = explained.record;
    if (!isFirst_) output_ += ',';
    isFirst_ = false;
    if (!options_.isDelimited) output_ += "\n  ";
    add(R"({"path":)", record.path);
    if (!record.isAbsent()) {
      add(R"(,"number":)", record.tag.fieldNumber());
      add(R"(,"offset":)", explained.offset);
      add(R"(,"header":)", record.header.size());
      add(R"(,"length":)", record.value.size());
    }
    add(R"(,"kind":)", explained.kind());
    if (!record.type) addLiteral(R"(,"unknown":)", "true");
    if (record.isAbsent()) addLiteral(R"(,"absent":)", "true");
    if (explained.message != nullptr) {
      add(R"(,"message":)", explained.message->fullName);
    } else if (explained.isHidden) {
      add(R"(,"value":)", "<redacted>");
    } else if (!record.isAbsent() || record.field->kind == FieldKind::implicitPresence) {
      addValue(record);
    }
    output_ += '}';
  }

  void error(const ExplainedError& error) override {
    add(R"(],"error":{"offset":)", message_->offset + error.error.offset);
    add(R"(,"path":)", error.error.path.text());
    add(R"(,"reason":)", error.error.reason());
    output_ += '}';
    hasError_ = true;
  }

  void endMessage() override {
    if (!hasError_) output_ += ']';
    hasError_ = false;
    output_ += "}\n";
  }

 private:
  // The start is what stands before the value: a comma or bracket, and the name.
  void add(std::string_view start, std::string_view text) {
    output_ += start;
    json::appendQuoted(text, output_);
  }
  void add(std::string_view start, std::uint64_t number) { addLiteral(start, std::to_string(number)); }
  void addLiteral(std::string_view start, std::string_view literal) { output_.append(start).append(literal); }
  void addBytes(std::span<const std::byte> bytes) {
    output_ += R"(,"value":")";
    spelling::appendBase64(charactersOf(bytes), output_);
    output_ += '"';
  }

  void addValue(const TracedRecord& record) {
    // Numbers of 64 bits are more than a script may take.
    if (!record.type) {
      const bool isNumber =
          record.tag.wireType() != WireType::lengthDelimited && record.tag.wireType() != WireType::startGroup;
      return isNumber ? add(R"(,"value":)", std::string_view(std::to_string(record.number)))
                      : addBytes(record.value);
    }
    switch (*record.type) {
      case ValueType::string: return add(R"(,"value":)", charactersOf(record.value));
      case ValueType::bytes: return addBytes(record.value);
      case ValueType::boolean: return addLiteral(R"(,"value":)", record.number != 0 ? "true" : "false");
      case ValueType::uint32:
        return addLiteral(R"(,"value":)", std::to_string(static_cast<std::uint32_t>(record.number)));
      case ValueType::message: return;
      case ValueType::enumeration:
        if (const std::string_view name = record.caseName(); !name.empty()) return add(R"(,"value":)", name);
        addLiteral(R"(,"value":)", std::to_string(static_cast<std::int32_t>(record.number)));
    }
  }

  const Options& options_;
  const ExplainedMessage* message_ = nullptr;
  bool isFirst_ = true;
  bool hasError_ = false;
};

}  // namespace

std::unique_ptr<Renderer> makeJsonRenderer(const Options& options, std::string& output) {
  return std::make_unique<JsonRenderer>(options, output);
}

}  // namespace orv::tool

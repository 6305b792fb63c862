#include "tools/orv/inspect/explanation.hpp"

#include <algorithm>
#include <array>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/input/frame_reader.hpp"
#include "tools/orv/inspect/renderers.hpp"

namespace orv::tool {

namespace {

// What is unknown is called by its wire type, in the order of WireType.
constexpr std::array<std::string_view, 6> wireTypeNames{"varint", "fixed64", "bytes",
                                                        "group",  "group",   "fixed32"};

// How many bytes, and which, if they can be read.
void appendBytes(std::string_view bytes, std::string& output) {
  appendByteCount(bytes.size(), output);
  if (bytes.empty() || !spelling::isReadable(bytes)) return;
  output += ' ';
  spelling::appendQuotedText(bytes, output);
}

void appendUnknown(const TracedRecord& record, std::string& output) {
  switch (record.tag.wireType()) {
    case WireType::lengthDelimited: return appendBytes(charactersOf(record.value), output);
    case WireType::startGroup: return appendByteCount(record.value.size(), output);
    default: output += std::to_string(record.number);
  }
}

// Goes through one message, and the payload of an envelope in its place.
class Explainer final : public TraceSink {
 public:
  Explainer(const ExplainedMessage& message, const Options& options, Renderer& renderer, OutputFile& output)
      : message_(message),
        renderer_(renderer),
        output_(output),
        innerTypes_(options.innerTypes),
        absent_(options.showsDefaults ? AbsentFields::tell : AbsentFields::leaveOut),
        hidesSecrets_(options.hidesSecrets),
        shownUpTo_(message.bytes.data()) {
    if (!message.type.isEnvelope()) return;
    const EnvelopeOutline outline = outlineOf(message.bytes);
    payload_ = outline.data ? options.payloads.payloadOf(outline.type) : nullptr;
    if (payload_ != nullptr) payloadStart_ = outline.data->data();
  }

  Outcome<std::optional<DecodeError>> run() {
    renderer_.beginMessage(message_);
    if (const auto traced = trace(message_.type, message_.bytes, *this, absent_); !traced)
      error_ = traced.error();
    if (error_) showError();
    renderer_.endMessage();
    if (!writeOutput()) return std::unexpected(written_.error());
    return error_;
  }

  bool record(const TracedRecord& record) override {
    const MessageType* const inner = innerTypeOf(record);
    const MessageDescriptor* const opened = inner != nullptr ? inner->descriptor
                                            : record.type == ValueType::message && !record.isAbsent()
                                                ? record.field->message
                                                : nullptr;
    const ExplainedRecord explained{.record = record,
                                    .offset = offsetOf(record.header.data()),
                                    .message = opened,
                                    .path = record.path.substr(outerPathSize_),
                                    .level = level_ + record.level,
                                    .isHidden = hidesSecrets_ && opened == nullptr && !record.isAbsent() &&
                                                (!record.type || record.field->isSecret)};
    renderer_.record(explained);
    shownUpTo_ = record.value.data() + explained.shownValue().size();
    return writeOutput() && (inner == nullptr || showInner(record, *inner));
  }

 private:
  // The type of the message that bytes are: an envelope's payload, or what they were said to be.
  const MessageType* innerTypeOf(const TracedRecord& record) const {
    if (record.type != ValueType::bytes || record.isAbsent()) return nullptr;
    if (level_ == 0 && record.level == 0 && record.value.data() == payloadStart_) return payload_;
    if (innerTypes_.empty()) return nullptr;
    std::string path(record.path);
    for (std::size_t at; (at = path.find('[')) != std::string::npos;) path.erase(at, path.find(']') + 1 - at);
    const auto found = innerTypes_.find(path);
    return found == innerTypes_.end() ? nullptr : found->second;
  }

  bool showInner(const TracedRecord& data, const MessageType& type) {
    const std::size_t outerPathSize = std::exchange(outerPathSize_, data.path.size() + 1);
    const std::size_t outerLevel = std::exchange(level_, level_ + data.level + 1);
    const auto traced = trace(type, data.value, *this, absent_);
    outerPathSize_ = outerPathSize;
    if (traced) {
      level_ = outerLevel;
      return *traced;
    }
    error_ = traced.error();
    error_->offset += static_cast<std::size_t>(data.value.data() - message_.bytes.data());
    return false;
  }

  void showError() {
    auto rest = message_.bytes.subspan(static_cast<std::size_t>(shownUpTo_ - message_.bytes.data()));
    // Nobody knows what they hold.
    if (hidesSecrets_) rest = rest.first(0);
    const std::ptrdiff_t good = message_.bytes.data() + error_->offset - shownUpTo_;
    renderer_.error({.error = *error_,
                     .offset = offsetOf(shownUpTo_),
                     .rest = rest,
                     .good = static_cast<std::size_t>(std::clamp<std::ptrdiff_t>(good, 0, std::ssize(rest))),
                     .isInPayload = level_ != 0,
                     .text = "error at " + bytePlace(message_.offset + error_->offset) + ": " +
                             error_->path.text() + ": " + error_->reason()});
  }

  // Much of a long message, before it is all there. False if writing fails.
  bool writeOutput() {
    if (written_ && output_.isFull()) written_ = output_.flush();
    return written_.has_value();
  }

  std::uint64_t offsetOf(const std::byte* at) const {
    return message_.offset + static_cast<std::uint64_t>(at - message_.bytes.data());
  }

  const ExplainedMessage& message_;
  Renderer& renderer_;
  OutputFile& output_;
  const std::map<std::string, const MessageType*, std::less<>>& innerTypes_;
  AbsentFields absent_;
  bool hidesSecrets_;
  const std::byte* shownUpTo_;
  const MessageType* payload_ = nullptr;  // of the envelope that is shown
  const std::byte* payloadStart_ = nullptr;
  std::size_t outerPathSize_ = 0;  // with its dot, in a payload
  std::size_t level_ = 0;          // of the payload's fields
  std::optional<DecodeError> error_;
  Outcome<void> written_;
};

}  // namespace

void appendByteCount(std::size_t count, std::string& output) {
  output.append(std::to_string(count)).append(count == 1 ? " byte" : " bytes");
}

std::string_view ExplainedRecord::kind() const {
  if (record.type) return nameOf(*record.type);
  return wireTypeNames[static_cast<std::size_t>(record.tag.wireType())];
}

void ExplainedRecord::appendValue(std::string& output) const {
  if (record.isAbsent() && record.field->kind != FieldKind::implicitPresence) {
    output += record.field->kind == FieldKind::repeated ? "empty" : "absent";
    return;
  }
  if (message != nullptr) {
    appendByteCount(record.value.size(), output);
    output.append(", ").append(message->fullName);
    return;
  }
  if (!record.type)
    output += record.field != nullptr ? "another wire type than the field's, kept as unknown: " : "unknown: ";
  if (isHidden) {
    appendByteCount(record.value.size(), output);
    output += ", <redacted>";
    return;
  }
  if (!record.type) return appendUnknown(record, output);
  switch (*record.type) {
    case ValueType::string: spelling::appendQuotedText(charactersOf(record.value), output); break;
    case ValueType::bytes: appendBytes(charactersOf(record.value), output); break;
    case ValueType::boolean: output += record.number != 0 ? "true" : "false"; break;
    case ValueType::uint32: output += std::to_string(static_cast<std::uint32_t>(record.number)); break;
    case ValueType::message: break;  // is told by its type
    case ValueType::enumeration: {
      const std::string_view name = record.caseName();
      if (!name.empty()) output.append(name).append(" (");
      output += std::to_string(static_cast<std::int32_t>(record.number));
      if (!name.empty()) output += ')';
    }
  }
  if (record.isAbsent()) output += ", by default";
}

std::unique_ptr<Renderer> Renderer::make(const Options& options, std::string& output) {
  switch (options.to.value_or(Format::text)) {
    case Format::json: return makeJsonRenderer(options, output);
    case Format::html: return makeHtmlRenderer(options, output);
    default: return makeTextRenderer(options, output);
  }
}

Outcome<std::optional<DecodeError>> explain(const ExplainedMessage& message, const Options& options,
                                            Renderer& renderer, OutputFile& output) {
  return Explainer(message, options, renderer, output).run();
}

}  // namespace orv::tool

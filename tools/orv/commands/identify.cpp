// identify.
#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>
#include <expected>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include <orv/byte_view.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/inspect/trace.hpp"

namespace orv::tool {

namespace {

constexpr double opaque = 0.5;  // for bytes of any content

// How much of a value's bytes is explained by the field that takes it.
double explainedShare(const TracedRecord& record) {
  constexpr double unlikely = 0.2;
  switch (*record.type) {
    case ValueType::string: return spelling::isReadable(charactersOf(record.value)) ? 1 : unlikely;
    case ValueType::bytes: return opaque;
    case ValueType::boolean: return record.number <= 1 ? 1 : unlikely;
    case ValueType::uint32: return record.number <= 0xFFFFFFFF ? 1 : unlikely;
    case ValueType::enumeration: return record.caseName().empty() ? unlikely : 1;
    case ValueType::message: break;  // what it holds is reported on its own
  }
  return 0;
}

// A type that the bytes could be, and how much of them it explains: fields that are checked while they are read, as
// messages and texts are, explain their bytes fully, bytes of any content half of theirs, unknown fields nothing.
class Candidate final : public TraceSink {
 public:
  Candidate(const MessageType& type, std::span<const std::byte> bytes) : type_(&type), bytes_(bytes) {}

  // Answers why the bytes are none of the type, if they are none.
  std::expected<bool, DecodeError> explain() {
    auto traced = trace(*type_, bytes_, *this);
    if (traced && type_->isEnvelope()) lookIntoEnvelope();
    return traced;
  }

  const MessageType& type() const { return *type_; }
  // From 0 to 1: the share of the bytes.
  double score() const { return bytes_.empty() ? 1 : explained_ / static_cast<double>(bytes_.size()); }
  std::size_t knownFields() const { return knownFields_; }
  std::size_t unknownFields() const { return unknownFields_; }

  bool record(const TracedRecord& record) override {
    if (!record.type) return ++unknownFields_, true;
    ++knownFields_;
    explained_ += static_cast<double>(record.header.size());
    explained_ += explainedShare(record) * static_cast<double>(record.value.size());
    return true;
  }

 private:
  // An envelope is the likelier when its data is the message that its type says.
  void lookIntoEnvelope() {
    const EnvelopeOutline outline = outlineOf(bytes_);
    const MessageType* const payload = outline.data ? PayloadPairing().payloadOf(outline.type) : nullptr;
    if (payload == nullptr) return;
    Candidate inner(*payload, *outline.data);
    if (!inner.explain()) return;
    // It was explained as bytes of any content.
    explained_ += inner.explained_ - opaque * static_cast<double>(outline.data->size());
    knownFields_ += inner.knownFields_;
    unknownFields_ += inner.unknownFields_;
  }

  const MessageType* type_;
  std::span<const std::byte> bytes_;
  double explained_ = 0;
  std::size_t knownFields_ = 0;
  std::size_t unknownFields_ = 0;
};

// The types that the bytes could be, the likeliest first; types that fit alike in the order of the protocol.
// The error is that of bytes that are no fields at all, whatever the type.
std::expected<std::vector<Candidate>, DecodeError> rankTypes(std::span<const std::byte> bytes) {
  std::vector<Candidate> candidates;
  for (const MessageType& type : allMessageTypes()) {
    Candidate candidate(type, bytes);
    auto explained = candidate.explain();
    // What is malformed to a type without fields is malformed to every type.
    if (!explained && type.descriptor->fields.empty()) {
      explained.error().path = {};
      return std::unexpected(explained.error());
    }
    if (explained) candidates.push_back(candidate);
  }
  std::ranges::sort(candidates, {}, [](const Candidate& candidate) {
    return std::tuple(-candidate.score(), candidate.unknownFields(), candidate.type().index);
  });
  return candidates;
}

// The likeliest first; of the types that explain nothing, none.
std::string describe(std::vector<Candidate> candidates) {
  std::erase_if(candidates, [](const Candidate& candidate) { return candidate.score() <= 0; });
  if (candidates.empty()) return "no type has any of these fields\n";
  std::size_t nameWidth = 0;
  for (const Candidate& candidate : candidates)
    nameWidth = std::max(nameWidth, candidate.type().fullName().size());
  std::string text;
  for (const Candidate& candidate : candidates) {
    std::array<char, 16> share;
    std::snprintf(share.data(), share.size(), "%3.0f %%  ", 100 * candidate.score());
    text.append(share.data()).append(candidate.type().fullName());
    text.append(nameWidth + 2 - candidate.type().fullName().size(), ' ');
    text += std::to_string(candidate.knownFields()) + (candidate.knownFields() == 1 ? " field" : " fields");
    if (candidate.unknownFields() != 0) text += ", " + std::to_string(candidate.unknownFields()) + " unknown";
    text += '\n';
  }
  return text;
}

class Identification final : public MessageWork {
 public:
  Identification(const Options& options, OutputFile& output) : options_(options), output_(output) {}

  Outcome<void> take(const MessageInput& message) override {
    const auto ranked = rankTypes(bytesOf(message.encoding()));
    if (!ranked) return std::unexpected(message.failureOf(ranked.error()));
    std::string text = std::exchange(isBehindMessage_, true) && message.frame().number > 1 ? "\n" : "";
    if (options_.files.size() > 1) text += spelling::printable(message.path()) + ":\n";
    if (options_.isDelimited) text += "message " + std::to_string(message.frame().number) + ":\n";
    return output_.write(text + describe(*ranked));
  }

 private:
  const Options& options_;
  OutputFile& output_;
  bool isBehindMessage_ = false;
};

}  // namespace

ExitStatus runIdentify(const Options& options) { return forEachMessage<Identification>(options); }

}  // namespace orv::tool

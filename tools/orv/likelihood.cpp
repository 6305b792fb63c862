#include "tools/orv/likelihood.hpp"

#include <algorithm>
#include <string_view>

#include "tools/orv/payload.hpp"
#include "tools/orv/trace.hpp"
#include "tools/orv/value_text.hpp"

namespace orv::tool {

namespace {

// How much of a value's bytes is explained by the field that takes it.
double explainedShare(const TracedRecord& record) {
  constexpr double opaque = 0.5;
  constexpr double unlikely = 0.2;
  const std::string_view characters(reinterpret_cast<const char*>(record.value.data()), record.value.size());
  switch (record.use) {
    case FieldUse::string: return isReadable(characters) ? 1 : unlikely;
    case FieldUse::bytes: return opaque;
    case FieldUse::boolean: return record.number <= 1 ? 1 : unlikely;
    case FieldUse::uint32: return record.number <= 0xFFFFFFFF ? 1 : unlikely;
    case FieldUse::enumeration: return record.name.empty() ? unlikely : 1;
    case FieldUse::message:  // what it holds is reported on its own
    case FieldUse::unknown: break;
  }
  return 0;
}

class Explanation final : public TraceSink {
 public:
  bool record(const TracedRecord& record) override {
    if (record.use == FieldUse::unknown) {
      ++unknownFields_;
      return true;
    }
    ++knownFields_;
    explained_ += static_cast<double>(record.header.size());
    explained_ += explainedShare(record) * static_cast<double>(record.value.size());
    return true;
  }

  void addPayload(const Explanation& payload, std::size_t size) {
    // The envelope had explained it as bytes of any content.
    explained_ += payload.explained_ - 0.5 * static_cast<double>(size);
    knownFields_ += payload.knownFields_;
    unknownFields_ += payload.unknownFields_;
  }

  Candidate candidate(const MessageType& type, std::size_t size) const {
    const double score = size == 0 ? 1 : explained_ / static_cast<double>(size);
    return {&type, score, knownFields_, unknownFields_};
  }

 private:
  double explained_ = 0;
  std::size_t knownFields_ = 0;
  std::size_t unknownFields_ = 0;
};

// An envelope is the likelier when its data is the message that its type says.
void lookIntoEnvelope(std::span<const std::byte> bytes, Explanation& explanation) {
  const auto envelope = SessionMessage::parse(bytes);
  if (!envelope || !envelope->hasData()) return;
  const MessageType* const payload = PayloadPairing().payloadOf(*envelope);
  if (payload == nullptr) return;
  Explanation inner;
  const auto data = envelope->data().bytes();
  if (trace(*payload, data, inner)) explanation.addPayload(inner, data.size());
}

// What is malformed to a type without fields is malformed to every type.
bool describesNoFields(const MessageType& type) { return &type == &typeOf<ConnectionResponse>(); }

}  // namespace

std::expected<std::vector<Candidate>, DecodeError> rankTypes(std::span<const std::byte> bytes) {
  std::vector<Candidate> candidates;
  for (const MessageType& type : allMessageTypes()) {
    Explanation explanation;
    auto traced = trace(type, bytes, explanation);
    if (!traced && describesNoFields(type)) {
      traced.error().path = {};
      return std::unexpected(traced.error());
    }
    if (!traced) continue;
    if (&type == &typeOf<SessionMessage>()) lookIntoEnvelope(bytes, explanation);
    candidates.push_back(explanation.candidate(type, bytes.size()));
  }
  std::ranges::stable_sort(candidates, [](const Candidate& left, const Candidate& right) {
    if (left.score != right.score) return left.score > right.score;
    return left.unknownFields < right.unknownFields;
  });
  return candidates;
}

}  // namespace orv::tool

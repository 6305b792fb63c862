// Shows an encoding byte by byte.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <span>
#include <string_view>

#include "tools/orv/dump_layout.hpp"
#include "tools/orv/failure.hpp"
#include "tools/orv/output_file.hpp"
#include "tools/orv/payload.hpp"
#include "tools/orv/trace.hpp"

namespace orv::tool {

// Writes an annotated dump of one message: a row, or as many as it takes, for each record.
class Dump final : public TraceSink {
 public:
  // Offsets are shown from `offset` on.
  Dump(OutputFile& output, const DumpLayout& layout, std::span<const std::byte> message, std::uint64_t offset)
      : output_(output), layout_(layout), message_(message), offset_(offset), shownUpTo_(message.data()) {}

  // Shows the message, an envelope with its payload in place. Malformed bytes are shown up to the error, with
  // the error where it stands; that is the answer then.
  Outcome<std::optional<DecodeError>> show(const MessageType& type, const PayloadPairing& payloads);

  bool record(const TracedRecord& record) override;

 private:
  bool showPayload(const TracedRecord& data);
  void showError(const DecodeError& error);
  void write(std::string_view text);
  std::uint64_t offsetOf(const std::byte* at) const {
    return offset_ + static_cast<std::uint64_t>(at - message_.data());
  }

  OutputFile& output_;
  const DumpLayout& layout_;
  std::span<const std::byte> message_;
  std::uint64_t offset_;
  const std::byte* shownUpTo_;
  const MessageType* payload_ = nullptr;  // of the envelope that is shown
  const std::byte* payloadStart_ = nullptr;
  std::optional<DecodeError> error_;
  std::size_t depth_ = 0;
  Outcome<void> written_;
};

}  // namespace orv::tool

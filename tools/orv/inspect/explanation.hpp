// Messages explained byte by byte: one way through the bytes, and the forms that it is shown in.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include <orv/decode_error.hpp>
#include "tools/orv/inspect/trace.hpp"
#include "tools/orv/options.hpp"
#include "tools/orv/output/output_file.hpp"

namespace orv::tool {

// What is explained.
struct ExplainedMessage {
  const MessageType& type;
  std::span<const std::byte> bytes;
  std::uint64_t offset;   // of the bytes in the input
  std::uint64_t number;   // in a stream, from 1; 0 for input that is one message
  std::string_view path;  // of the file
};

// A record in its place.
struct ExplainedRecord {
  const TracedRecord& record;
  std::uint64_t offset;  // of its first byte in the input
  const MessageDescriptor*
      message;            // the type of the message that the value is, whose records follow; or none
  std::string_view path;  // the record's, from the payload on where it is in one
  std::size_t level;      // how many messages it is in, payloads among them, beside the outermost
  bool isHidden;          // whether only the value's length may show

  bool isInPayload() const { return path.size() != record.path.size(); }

  // What the record holds, by its type or, where it is unknown, by its wire type.
  std::string_view kind() const;
  // Of a message, what fields there are, the value is not shown beside them.
  std::span<const std::byte> shownValue() const {
    return message != nullptr || isHidden ? record.value.first(0) : record.value;
  }
  void appendValue(std::string& output) const;
};

// Where a message is malformed: the bytes that no record has shown, and in them the first that is wrong.
struct ExplainedError {
  const DecodeError& error;
  std::uint64_t offset;  // of the rest in the input
  std::span<const std::byte> rest;
  std::size_t good;  // how many bytes of the rest stand before the error
  bool isInPayload;
  std::string text;  // place, path and reason
};

// Shows messages in one form. It writes to the end of a string, which may be emptied at any time.
class Renderer {
 public:
  static std::unique_ptr<Renderer> make(const Options& options, std::string& output);

  virtual ~Renderer() = default;
  virtual void beginMessage(const ExplainedMessage& message) = 0;
  virtual void record(const ExplainedRecord& record) = 0;
  virtual void error(const ExplainedError& error) = 0;
  virtual void endMessage() {}
  // A file ends in a piece that is no message.
  virtual void endFile(std::string_view) {}
  // There is no more.
  virtual void finish() {}

 protected:
  explicit Renderer(std::string& output) : output_(output) {}

  std::string& output_;  // NOLINT(*-non-private-member-variables-in-classes): what all renderers write to
};

// Shows a message up to its end or to its error, which is the answer then. The renderer writes to what the output has
// gathered.
Outcome<std::optional<DecodeError>> explain(const ExplainedMessage& message, const Options& options,
                                            Renderer& renderer, OutputFile& output);

}  // namespace orv::tool

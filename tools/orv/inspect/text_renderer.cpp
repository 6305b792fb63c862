#include <unistd.h>

#include <algorithm>
#include <utility>

#include <orv/spelling/value_text.hpp>
#include "tools/orv/inspect/dump_layout.hpp"
#include "tools/orv/inspect/renderers.hpp"

namespace orv::tool {

namespace {

// A row, or as many as it takes, for each record.
class DumpRenderer final : public Renderer {
 public:
  DumpRenderer(const Options& options, std::string& output)
      : Renderer(output),
        options_(options),
        layout_(terminalWidth(descriptor()), Palette(options.colour, descriptor())) {}

  void beginMessage(const ExplainedMessage& message) override {
    if (std::exchange(isBehindMessage_, true) && message.number > 1) output_ += '\n';
    value_.clear();
    if (options_.files.size() > 1) value_.append(spelling::printable(message.path)).append(": ");
    if (options_.isDelimited) value_.append("message ").append(std::to_string(message.number)).append(": ");
    value_.append(message.type.fullName()).append(", ");
    appendByteCount(message.bytes.size(), value_);
    layout_.appendHeading(output_, value_);
  }

  void record(const ExplainedRecord& explained) override {
    const TracedRecord& record = explained.record;
    value_.clear();
    explained.appendValue(value_);
    const auto colour = record.isAbsent() ? Palette::Colour::offset
                        : record.type     ? Palette::Colour::value
                                          : Palette::Colour::unknown;
    layout_.appendRecord(output_, {explained.offset, record.header, explained.shownValue(), colour},
                         {.depth = explained.isInPayload() ? 1U : 0U,
                          .path = explained.path,
                          .kind = explained.kind(),
                          .value = value_,
                          .colour = colour});
  }

  // The bytes that no row has shown yet, as far as they help.
  void error(const ExplainedError& error) override {
    constexpr std::size_t most = 32;
    const auto shown = error.rest.first(std::min(error.rest.size(), most));
    const std::size_t good = std::min(error.good, shown.size());
    value_.clear();
    if (error.rest.size() != shown.size()) {
      value_ = "… ";
      appendByteCount(error.rest.size() - shown.size(), value_);
      value_ += " more";
    }
    if (!shown.empty()) {
      layout_.appendRecord(output_,
                           {error.offset, shown.first(good), shown.subspan(good), Palette::Colour::error},
                           {.depth = error.isInPayload ? 1U : 0U,
                            .path = {},
                            .kind = {},
                            .value = value_,
                            .colour = Palette::Colour::error});
    }
    layout_.appendError(output_, error.text);
  }

  void endFile(std::string_view failure) override {
    layout_.appendError(output_, spelling::printable(failure));
  }

 private:
  int descriptor() const { return options_.output ? -1 : STDOUT_FILENO; }

  const Options& options_;
  DumpLayout layout_;
  std::string value_;  // of the record, or the heading
  bool isBehindMessage_ = false;
};

}  // namespace

std::unique_ptr<Renderer> makeTextRenderer(const Options& options, std::string& output) {
  return std::make_unique<DumpRenderer>(options, output);
}

}  // namespace orv::tool

// inspect.
#include <memory>

#include <orv/byte_view.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/inspect/explanation.hpp"

namespace orv::tool {

namespace {

class Inspection final : public MessageWork {
 public:
  Inspection(const Options& options, OutputFile& output)
      : options_(options), output_(output), renderer_(Renderer::make(options, output.gathered())) {}

  Outcome<void> take(const MessageInput& message) override {
    const ExplainedMessage explained{.type = *options_.type,
                                     .bytes = bytesOf(message.encoding()),
                                     .offset = message.encodingOffset(),
                                     .number = message.frame().number,
                                     .path = message.path()};
    const auto error = explain(explained, options_, *renderer_, output_);
    if (!error) return std::unexpected(error.error());
    if (error->has_value()) return std::unexpected(message.failureOf(**error));
    return {};
  }

  // Where a stream ends in a piece that is no message, the dump says so too.
  Outcome<void> takeEnd(const Failure& failure) override {
    if (failure.status == ExitStatus::malformed) renderer_->endFile(failure.line);
    return {};
  }

  Outcome<void> finish() override {
    renderer_->finish();
    return {};
  }

  bool showsErrors() const override { return true; }

 private:
  const Options& options_;
  OutputFile& output_;
  std::unique_ptr<Renderer> renderer_;
};

}  // namespace

ExitStatus runInspect(const Options& options) { return forEachMessage<Inspection>(options); }

}  // namespace orv::tool

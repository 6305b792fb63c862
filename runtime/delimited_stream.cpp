#include <orv/delimited_stream.hpp>

#include <google/protobuf/io/zero_copy_stream_impl_lite.h>

#include <cassert>
#include <span>
#include <utility>

namespace orv::inline v0 {

namespace io = google::protobuf::io;

class DelimitedReader::Source {
 public:
  Source(ReadFunction read, const DecodeLimits& limits)
      : parser_(limits), stream_(std::move(read)), buffered_(&stream_) {}

  std::expected<std::optional<std::span<const std::byte>>, StreamError> next();
  const DelimitedParser& parser() const { return parser_; }

 private:
  // The read function as libprotobuf's streams see it.
  class Stream final : public io::CopyingInputStream {
   public:
    explicit Stream(ReadFunction read) : read_(std::move(read)) {}

    int Read(void* buffer, int size) override {
      const std::ptrdiff_t count =
          read_(std::span(static_cast<std::byte*>(buffer), static_cast<std::size_t>(size)));
      const bool isPossible = count >= 0 && count <= size;
      hasFailed_ = !isPossible;  // nobody reads on after a failure
      return isPossible ? static_cast<int>(count) : -1;
    }
    bool hasFailed() const { return hasFailed_; }

   private:
    ReadFunction read_;
    bool hasFailed_ = false;
  };

  DelimitedParser parser_;
  Stream stream_;
  io::CopyingInputStreamAdaptor buffered_;
};

std::expected<std::optional<std::span<const std::byte>>, StreamError> DelimitedReader::Source::next() {
  for (;;) {
    auto message = parser_.next();
    if (!message || message->has_value()) return message;

    // It stands if memory runs out on the way, or the read function throws: nobody knows then where the stream is.
    auto failure = parser_.fail(StreamError::Cause::readFailed);
    const void* bytes = nullptr;
    int size = 0;
    const bool isThere = buffered_.Next(&bytes, &size);
    if (stream_.hasFailed()) return failure;
    if (isThere)
      parser_.push(std::span(static_cast<const std::byte*>(bytes), static_cast<std::size_t>(size)));
    parser_.error_.reset();
    if (isThere) continue;
    const auto end = parser_.finish();
    if (!end) return std::unexpected(end.error());
    return std::nullopt;
  }
}

DelimitedReader::DelimitedReader(ReadFunction read, const DecodeLimits& limits)
    : source_(std::make_unique<Source>(std::move(read), limits)) {}
DelimitedReader::DelimitedReader(DelimitedReader&&) noexcept = default;
DelimitedReader& DelimitedReader::operator=(DelimitedReader&&) noexcept = default;
DelimitedReader::~DelimitedReader() = default;

std::expected<std::optional<std::span<const std::byte>>, StreamError> DelimitedReader::next() {
  assert(source_ != nullptr && "a reader that was moved from reads nothing");
  return source_->next();
}

const DelimitedParser& DelimitedReader::parser() const {
  assert(source_ != nullptr && "a reader that was moved from has no place");
  return source_->parser();
}

}  // namespace orv

#include "tools/orv/output/output_file.hpp"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "tools/orv/output/palette.hpp"

namespace orv::tool {

OutputFile::OutputFile(const std::optional<std::string>& path)
    : name_(path.value_or("-")), isStandardOutput_(name_ == "-") {
  if (!isStandardOutput_) return;
  name_ = "standard output";
  descriptor_ = STDOUT_FILENO;
}

OutputFile::~OutputFile() {
  if (!isStandardOutput_ && descriptor_ >= 0) ::close(descriptor_);
}

bool OutputFile::isTerminal() const { return isStandardOutput_ && tool::isTerminal(STDOUT_FILENO); }

Outcome<void> OutputFile::open() {
  if (descriptor_ >= 0) return {};
  constexpr mode_t readableByAll = 0666;
  descriptor_ = ::open(name_.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, readableByAll);
  if (descriptor_ < 0) return failWithErrno(name_);
  return {};
}

Outcome<void> OutputFile::write(std::string_view text) {
  constexpr std::size_t enough = std::size_t{64} << 10;
  gathered_ += text;
  if (gathered_.size() < enough) return {};
  return flush();
}

Outcome<void> OutputFile::flush() {
  if (gathered_.empty()) return {};
  auto written = writeGathered();
  hasFailed_ = !written;
  return written;
}

Outcome<void> OutputFile::writeGathered() {
  if (auto opened = open(); !opened) return opened;
  std::string_view rest = gathered_;
  while (!rest.empty()) {
    const ssize_t count = ::write(descriptor_, rest.data(), rest.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0 && errno == EPIPE) return endQuietly();
    if (count < 0) return failWithErrno(name_);
    rest.remove_prefix(static_cast<std::size_t>(count));
  }
  gathered_.clear();
  return {};
}

Outcome<void> OutputFile::finish() {
  if (auto flushed = flush(); !flushed) return flushed;
  if (isStandardOutput_) return {};
  if (auto opened = open(); !opened) return opened;
  const int descriptor = std::exchange(descriptor_, -1);
  // Some file systems tell of a full disk only here.
  if (::close(descriptor) != 0) return failWithErrno(name_);
  return {};
}

ExitStatus writeWhole(const std::optional<std::string>& path, std::string_view text) {
  OutputFile output(path);
  auto written = output.write(text);
  if (written) written = output.finish();
  if (written) return ExitStatus::done;
  report(written.error());
  return written.error().status;
}

}  // namespace orv::tool

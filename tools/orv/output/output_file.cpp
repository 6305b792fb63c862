#include "tools/orv/output/output_file.hpp"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <utility>

#include "tools/orv/output/palette.hpp"

namespace orv::tool {

namespace {

constexpr std::array endingSignals{SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGXCPU, SIGXFSZ};

// The file that is written aside, if there is one: what a signal's handler can know.
// NOLINTNEXTLINE(cppcoreguidelines-avoid-non-const-global-variables): a handler is given nothing else
std::atomic<const char*> unfinished = nullptr;
static_assert(std::atomic<const char*>::is_always_lock_free);

// The handler is installed for one signal, which then does what it does without.
extern "C" void removeUnfinished(int signal) {
  if (const char* const path = unfinished) ::unlink(path);
  std::raise(signal);
}

void removeWhenSignalled() {
  struct sigaction once = {};
  once.sa_handler = removeUnfinished;
  once.sa_flags = static_cast<int>(SA_RESETHAND);
  for (const int signal : endingSignals) {
    struct sigaction present = {};
    // What is ignored, by nohup for instance, stays so.
    if (::sigaction(signal, nullptr, &present) == 0 && present.sa_handler == SIG_DFL)
      ::sigaction(signal, &once, nullptr);
  }
}

// Descriptors that are open have names too; the file that one stands for is not to be replaced.
bool namesDescriptor(std::string_view path) {
  return path == "/dev/stderr" || path.starts_with("/dev/fd/") || path.starts_with("/proc/");
}

}  // namespace

OutputFile::OutputFile(const std::optional<std::string>& path)
    : name_(path.value_or("-")), isStandardOutput_(name_ == "-" || name_ == "/dev/stdout") {
  if (!isStandardOutput_) return;
  name_ = "standard output";
  descriptor_ = STDOUT_FILENO;
}

OutputFile::~OutputFile() {
  if (!isStandardOutput_ && descriptor_ >= 0) ::close(descriptor_);
  if (unfinished.exchange(nullptr) != nullptr) ::unlink(aside_.c_str());
}

bool OutputFile::isTerminal() const { return isStandardOutput_ && tool::isTerminal(STDOUT_FILENO); }

Outcome<void> OutputFile::open() {
  if (descriptor_ >= 0) return {};
  constexpr mode_t readableByAll = 0666;
  struct stat old = {};
  struct stat link = {};
  const bool isThere = ::stat(name_.c_str(), &old) == 0;
  const bool isDanglingLink = !isThere && ::lstat(name_.c_str(), &link) == 0;
  if (namesDescriptor(name_) || isDanglingLink || (isThere && !S_ISREG(old.st_mode))) {
    descriptor_ = ::open(name_.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, readableByAll);
    return descriptor_ < 0 ? failWithErrno(name_) : Outcome<void>();
  }
  if (!isThere) return openAside(name_, readableByAll);
  // Whom the old file's mode keeps out, it keeps out here too.
  std::array<char, PATH_MAX> resolved;
  if (::faccessat(AT_FDCWD, name_.c_str(), W_OK, AT_EACCESS) != 0 ||
      ::realpath(name_.c_str(), resolved.data()) == nullptr)
    return failWithErrno(name_);
  if (auto opened = openAside(resolved.data(), old.st_mode & 0777); !opened) return opened;
  // Only root gives files away; a group one is in can be kept.
  if (::fchown(descriptor_, old.st_uid, old.st_gid) != 0) [[maybe_unused]]
    const int kept = ::fchown(descriptor_, static_cast<uid_t>(-1), old.st_gid);
  ::fchmod(descriptor_, old.st_mode & 0777);
  return {};
}

Outcome<void> OutputFile::openAside(const std::string& target, mode_t mode) {
  target_ = target;
  aside_ = target.substr(0, target.rfind('/') + 1) + ".orv-" + std::to_string(::getpid());
  sigset_t signals;
  sigset_t before;
  ::sigemptyset(&signals);
  for (const int signal : endingSignals) ::sigaddset(&signals, signal);
  // So that none comes when the file is there and not yet known.
  ::sigprocmask(SIG_BLOCK, &signals, &before);
  while ((descriptor_ = ::open(aside_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode)) < 0 &&
         errno == EEXIST)
    aside_ += '~';
  Outcome<void> opened;
  if (descriptor_ < 0) {
    opened = failWithErrno("the folder of " + name_);
  } else {
    unfinished = aside_.c_str();
    removeWhenSignalled();
  }
  ::sigprocmask(SIG_SETMASK, &before, nullptr);
  return opened;
}

Outcome<void> OutputFile::write(std::string_view text) {
  for (; !text.empty(); text.remove_prefix(std::min(text.size(), enough))) {
    gathered_ += text.substr(0, enough);
    if (!isFull()) continue;
    if (auto flushed = flush(); !flushed) return flushed;
  }
  return {};
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
  if (target_.empty()) return {};
  if (::rename(aside_.c_str(), target_.c_str()) != 0) return failWithErrno(name_);
  unfinished = nullptr;
  return {};
}

ExitStatus writeWhole(std::string_view text) {
  OutputFile output(std::nullopt);
  auto written = output.write(text);
  if (written) written = output.finish();
  if (written) return ExitStatus::done;
  report(written.error());
  return written.error().status;
}

}  // namespace orv::tool

// Where output goes.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "tools/orv/failure.hpp"

namespace orv::tool {

// A file, or standard output. A regular file is written aside, under another name in its folder, and takes its
// place when it is finished: until then, and if it never is, by an error or a signal, the old file stays as it
// was and nothing else is left behind. It is an input at the same time if need be. What is no regular file is
// written to at once.
class OutputFile {
 public:
  // "-", "/dev/stdout" and none are standard output.
  explicit OutputFile(const std::optional<std::string>& path);
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;
  ~OutputFile();

  bool isTerminal() const;

  // Gathers small pieces. Fails quietly where a pipe's reader is gone.
  [[nodiscard]] Outcome<void> write(std::string_view text);
  // What is gathered, to append to. It is to be flushed when it is full.
  std::string& gathered() { return gathered_; }
  bool isFull() const { return gathered_.size() >= enough; }
  // Writes what is gathered, so that it is seen before what else is written, and before anything is waited for.
  [[nodiscard]] Outcome<void> flush();
  // Writes what is gathered, after which nothing may follow; a file is there now even if that was nothing.
  [[nodiscard]] Outcome<void> finish();

  // Whether writing failed, quietly or not: there is no use in going on.
  bool hasFailed() const { return hasFailed_; }

 private:
  Outcome<void> open();
  Outcome<void> openAside(const std::string& target, mode_t mode);
  Outcome<void> writeGathered();

  static constexpr std::size_t enough = std::size_t{64} << 10;

  std::string name_;    // of the file, as it is given
  std::string target_;  // that is replaced in the end, behind all links; empty where nothing is
  std::string aside_;   // what is written in its place so far
  bool isStandardOutput_;
  int descriptor_ = -1;
  std::string gathered_;
  bool hasFailed_ = false;
};

// Writes to standard output a text that is the whole of it, and reports what fails.
ExitStatus writeWhole(std::string_view text);

}  // namespace orv::tool

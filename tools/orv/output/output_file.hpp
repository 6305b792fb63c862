// Where output goes.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "tools/orv/failure.hpp"

namespace orv::tool {

// A file, or standard output. A file is not touched before there is something to write into it.
class OutputFile {
 public:
  // "-" and none are standard output.
  explicit OutputFile(const std::optional<std::string>& path);
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;
  ~OutputFile();

  bool isTerminal() const;

  // Gathers small pieces. Fails quietly where a pipe's reader is gone.
  [[nodiscard]] Outcome<void> write(std::string_view text);
  // Writes what is gathered, so that it stands before what else is written to the same terminal.
  [[nodiscard]] Outcome<void> flush();
  // Writes what is gathered, after which nothing may follow; a file is there now even if that was nothing.
  [[nodiscard]] Outcome<void> finish();

  // Whether writing failed, quietly or not: there is no use in going on.
  bool hasFailed() const { return hasFailed_; }

 private:
  Outcome<void> open();
  Outcome<void> writeGathered();

  std::string name_;
  bool isStandardOutput_;
  int descriptor_ = -1;
  std::string gathered_;
  bool hasFailed_ = false;
};

// Writes a text that is the whole of the output, and reports what fails.
ExitStatus writeWhole(const std::optional<std::string>& path, std::string_view text);

}  // namespace orv::tool

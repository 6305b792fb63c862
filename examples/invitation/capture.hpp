// The record of a session.
#pragma once

#include <cstddef>
#include <string>
#include <utility>

#include <orv/session_message.hpp>
#include "examples/invitation/outcome.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

// A file of messages, each behind its length, in the order in which the host received and sent them.
class Capture {
 public:
  // Replaces a file that is there.
  static Outcome<Capture> create(std::string path);

  Outcome<> append(const orv::SessionMessage& message);

  const std::string& path() const { return path_; }
  std::size_t size() const { return size_; }

 private:
  Capture(std::string path, Descriptor file) : path_(std::move(path)), file_(std::move(file)) {}

  std::string path_;
  Descriptor file_;
  std::size_t size_ = 0;
};

}  // namespace invitation

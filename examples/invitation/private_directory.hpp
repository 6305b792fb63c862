// A directory for the socket file, and the removal of both.
#pragma once

#include <string>
#include <utility>

#include "examples/invitation/outcome.hpp"

namespace invitation {

// A new directory that only this user may enter. It is removed with its owner, when it is empty by then.
class PrivateDirectory {
 public:
  static Outcome<PrivateDirectory> create();
  PrivateDirectory(PrivateDirectory&& other) noexcept : path_(std::exchange(other.path_, {})) {}
  PrivateDirectory& operator=(PrivateDirectory&&) = delete;
  ~PrivateDirectory();

  const std::string& path() const { return path_; }

 private:
  explicit PrivateDirectory(std::string path) : path_(std::move(path)) {}

  std::string path_;
};

// Removes a socket file that exists by now.
class SocketFileRemover {
 public:
  explicit SocketFileRemover(std::string path) : path_(std::move(path)) {}
  SocketFileRemover(const SocketFileRemover&) = delete;
  SocketFileRemover& operator=(const SocketFileRemover&) = delete;
  ~SocketFileRemover();

 private:
  std::string path_;
};

}  // namespace invitation

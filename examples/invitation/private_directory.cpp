#include "examples/invitation/private_directory.hpp"

#include <unistd.h>

#include <cstdlib>

#include "examples/invitation/socket.hpp"

namespace invitation {

Outcome<PrivateDirectory> PrivateDirectory::create() {
  const char* const parent = std::getenv("TMPDIR");
  std::string path = std::string(parent != nullptr && *parent != '\0' ? parent : "/tmp") + "/orv-XXXXXX";
  if (::mkdtemp(path.data()) == nullptr) return systemFailure("cannot make the directory " + path);
  return PrivateDirectory(std::move(path));
}

PrivateDirectory::~PrivateDirectory() {
  if (!path_.empty()) ::rmdir(path_.c_str());
}

SocketFileRemover::~SocketFileRemover() { ::unlink(path_.c_str()); }

}  // namespace invitation

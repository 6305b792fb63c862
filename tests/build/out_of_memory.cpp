// A program that could go on when memory runs out, with a library that was built without exceptions: the library
// ends it at once, and says why, rather than letting the exception through.
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <new>
#include <string>

#include <orv/group.hpp>

namespace {

bool isOut = false;

// Reads a group while memory is out.
int readInVain(const std::string& bytes) {
  orv::Group group;
  try {
    isOut = true;
    (void)group.merge(bytes);
  } catch (const std::bad_alloc&) {
    return EXIT_SUCCESS;
  }
  return EXIT_SUCCESS;
}

}  // namespace

void* operator new(std::size_t size) {
  if (isOut) throw std::bad_alloc();
  return std::malloc(size);
}
void operator delete(void* block) noexcept { std::free(block); }
void operator delete(void* block, std::size_t) noexcept { std::free(block); }

int main() {
  // A member, a text that is long, an unknown field.
  const std::string inputs[] = {std::string("\x0A\x02\x12\x00", 4), "\x12\x35\x0A\x33" + std::string(51, 'x'),
                                std::string("\x28\x01", 2)};
  for (const std::string& input : inputs) {
    int ends[2];
    if (pipe(ends) != 0) return EXIT_FAILURE;
    const pid_t child = fork();
    if (child == 0) {
      dup2(ends[1], STDERR_FILENO);
      _exit(readInVain(input));
    }
    close(ends[1]);
    std::string said;
    for (char character; read(ends[0], &character, 1) == 1;) said += character;
    close(ends[0]);
    int status = 0;
    waitpid(child, &status, 0);
    if (!WIFSIGNALED(status) || WTERMSIG(status) != SIGABRT ||
        said.find("std::bad_alloc") == std::string::npos) {
      std::fputs("it went on, or ended without a word\n", stderr);
      return EXIT_FAILURE;
    }
  }
}

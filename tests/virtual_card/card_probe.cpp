// Says what a program sees that the library was preloaded into: one line for each node given, and
// the preload list it passes on to its children.
#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>

int main(int count, char **arguments) {
  for (int n = 1; n < count; ++n) {
    const int fd = open(arguments[n], O_RDWR);
    std::printf("%s %s\n", arguments[n], fd >= 0 ? "opened" : errno == ENOENT ? "absent" : "refused");
    if (fd >= 0) close(fd);
  }
  const char *preload = std::getenv("LD_PRELOAD");
  std::printf("preload \"%s\"\n", preload == nullptr ? "" : preload);
  std::fflush(stdout);
  return std::system("printf 'child \"%s\"\\n' \"$LD_PRELOAD\"");
}

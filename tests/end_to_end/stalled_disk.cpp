// A library in front of a program: while the file named by ZARVO_STALL exists, the disk takes nothing. Calls
// that write then wait.
#include <dlfcn.h>
#include <sys/uio.h>
#include <unistd.h>

#include <cstdlib>

namespace {

void wait_for_disk() {
  const char *const stall = getenv("ZARVO_STALL");
  while (stall != nullptr && access(stall, F_OK) == 0) usleep(10000);
}

template <typename Function>
Function *real(const char *name, Function * /*declared*/) {
  return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

}  // namespace

extern "C" {

ssize_t writev(int file, const iovec *pieces, int count) {
  static const auto real_writev = real("writev", &writev);
  wait_for_disk();
  return real_writev(file, pieces, count);
}

int fdatasync(int file) {
  static const auto real_fdatasync = real("fdatasync", &fdatasync);
  wait_for_disk();
  return real_fdatasync(file);
}
}

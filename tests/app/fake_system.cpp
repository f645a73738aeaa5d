// The wall clock, the disk, the pause and the shell as a test of the recording wants them; these names come
// before libc's in the program that links this.
#include <sys/vfs.h>

#include "recording_fixture.h"

extern "C" {

time_t time(time_t *result) noexcept {
  if (result) *result = fake_system::clock_now;
  return fake_system::clock_now;
}

int statfs(const char *path, struct statfs *result) noexcept {
  const int status = real("statfs", statfs)(path, result);
  result->f_blocks = fake_system::disk_blocks;
  result->f_bfree = fake_system::disk_free;
  return status;
}

unsigned sleep(unsigned seconds) {
  fake_system::slept += seconds;
  return 0;
}

int system(const char *command) {
  if (fake_system::while_playing) fake_system::while_playing();
  return fake_system::shell_broken ? -1 : real("system", system)(command);
}
}

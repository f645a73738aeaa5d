// Opens a recording for writing.
#include "recording/open.h"

#include <fcntl.h>

namespace recording {

std::FILE *open_unbuffered(const std::string &path) {
  // Without O_NONBLOCK, a pipe with this name would block open() until another process reads from it. Without
  // O_NOFOLLOW, a link with this name would truncate the file that it leads to.
  const int file =
      open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NONBLOCK | O_NOFOLLOW | O_CLOEXEC, 0666);
  std::FILE *const stream = file < 0 ? nullptr : fdopen(file, "w");
  if (stream != nullptr) std::setvbuf(stream, nullptr, _IONBF, 0);
  return stream;
}

}  // namespace recording

/**
 * @file files.h
 * Writes files without surprises for the host: no wait for a pipe, no signal at the file size limit. Results
 * below zero are negated error numbers.
 */
#ifndef VIRTUAL_CARD_FILES_H
#define VIRTUAL_CARD_FILES_H

#include <csignal>
#include <string>
#include <string_view>

namespace virtual_card {

/// While an object of this class exists, a write beyond RLIMIT_FSIZE on this thread fails with EFBIG and
/// raises no SIGXFSZ, which would end the host.
class FileLimitFails {
 public:
  FileLimitFails();
  ~FileLimitFails();
  FileLimitFails(const FileLimitFails &) = delete;
  FileLimitFails &operator=(const FileLimitFails &) = delete;

 private:
  sigset_t only_{};
  sigset_t before_{};
  bool pending_before_;
};

/// Returns a descriptor of an empty file. Creates the file or discards its content. Returns -EINVAL for
/// anything but a regular file, and leaves it alone.
long create_file(const std::string &path);
/// Writes all of the text. Returns 0 or the error.
long write_all(int fd, std::string_view text);

}  // namespace virtual_card

#endif

// Writes a stream of zarvo_record and counts what has come.
#include "record_stream.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace {

/// Writes data in pieces. Returns 0 or the errno of a write that failed. While a pipe is full, waits until
/// `stopping` is set, and then leaves out the rest.
int write_pieces(int file, const u8 *data, std::size_t size, std::size_t piece,
                 const std::atomic<bool> &stopping) {
  constexpr int kWaitMs = 100;
  while (size > 0) {
    pollfd writable{file, POLLOUT, 0};
    if (poll(&writable, 1, kWaitMs) == 0) {
      if (stopping) return 0;
      continue;
    }
    const ssize_t written = write(file, data, std::min(size, piece));
    if (written < 0) return errno;
    data += written;
    size -= static_cast<std::size_t>(written);
  }
  return 0;
}

}  // namespace

void Stream::choose(const std::string &name, const StreamKind &kind) {
  name_ = name;
  kind_ = kind;
}

void Stream::create(bool overwrite) {
  // O_NONBLOCK: a pipe in the place of the file must not block open().
  const int how = overwrite ? O_TRUNC | O_NOFOLLOW | O_NONBLOCK : O_EXCL;
  file_ = open(name_.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | how, 0666);
  if (file_ < 0) throw std::runtime_error("cannot create " + name_ + ": " + std::strerror(errno));
  piece_ = SIZE_MAX;
}

void Stream::take(int file) {
  file_ = file;
  piece_ = PIPE_BUF;  // a pipe that poll() calls writable takes so much without blocking
}

void Stream::begin(Clock::time_point now) {
  last_ = now;
}

int Stream::append(const u8 *data, i32 length, i32 flags, const std::atomic<bool> &stopping) {
  const auto now = Clock::now();
  note_gap(now);
  last_ = now;
  ++frames_;
  bytes_ += static_cast<std::uint64_t>(length);
  if (flags & ZV_FLAG_MOTION) ++motion_;
  if (flags & ZV_FLAG_VIDEO_LOSS) ++lost_signal_;
  return write_pieces(file_, data, static_cast<std::size_t>(length), piece_, stopping);
}

int Stream::end(Clock::time_point now) {
  note_gap(now);
  return close(file_) == 0 ? 0 : errno;
}

void Stream::note_gap(Clock::time_point now) {
  longest_gap_ = std::max(longest_gap_, silence(now));
}

std::uint64_t Stream::expected(double seconds) const {
  return static_cast<std::uint64_t>(kind_.rate * seconds);
}

std::uint64_t Stream::missing(double seconds) const {
  const std::uint64_t due = expected(seconds);
  return due - std::min(due, frames());
}

bool Stream::incomplete(double seconds) const {
  const std::uint64_t gone = missing(seconds);
  return gone > kOnTheirWay && gone * 100 > expected(seconds);
}

void Stream::report(double seconds) const {
  std::printf("%s: %ju %s, %ju bytes, %.1f kbit/s, expected %ju, missing %ju, longest gap %.2f s",
              name_.c_str(), frames(), kind_.unit, bytes(), static_cast<double>(bytes()) * 8 / 1000 / seconds,
              expected(seconds), missing(seconds), std::chrono::duration<double>(longest_gap_).count());
  if (kind_.is_video) std::printf(", motion in %ju, signal lost in %ju", motion_, lost_signal_);
  std::printf("\n");
}

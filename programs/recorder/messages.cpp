// Passes lines for standard error to the main thread.
#include "messages.h"

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <climits>

#include "recording/wall_time.h"

namespace recorder {

bool print_in_time(int file, std::string_view text) {
  constexpr int kMomentMs = 100;
  while (!text.empty()) {
    pollfd writable{file, POLLOUT, 0};
    if (poll(&writable, 1, kMomentMs) <= 0) return false;
    // A pipe that poll() calls writable takes so much without blocking.
    const ssize_t written = write(file, text.data(), std::min<std::size_t>(text.size(), PIPE_BUF));
    if (written < 0) break;
    text.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

void Messages::add(const std::string &line, std::int64_t time) {
  const std::lock_guard lock(mutex_);
  if (lines_.size() < kMost) lines_.push_back(recording::local_text(time) + " " + line);
}

void Messages::print() {
  // A reader that takes a line at a time must not hold the main thread up either.
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(1);
  while (std::chrono::steady_clock::now() < end) {
    std::string line = "zarvo_recorder: ";
    {
      const std::lock_guard lock(mutex_);
      if (lines_.empty()) return;
      line += lines_.front() + "\n";
    }
    if (!print_in_time(STDERR_FILENO, line)) return;
    const std::lock_guard lock(mutex_);
    lines_.pop_front();
  }
}

}  // namespace recorder

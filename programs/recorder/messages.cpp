// Passes lines for standard error to the main thread.
#include "messages.h"

#include <cstdio>

#include "recording/wall_time.h"

namespace recorder {

void Messages::add(const std::string &line, std::int64_t time) {
  const std::lock_guard lock(mutex_);
  if (lines_.size() < kMost) lines_.push_back(recording::local_text(time) + " " + line);
}

void Messages::print() {
  std::vector<std::string> lines;
  {
    const std::lock_guard lock(mutex_);
    lines.swap(lines_);
  }
  for (const std::string &line : lines) std::fprintf(stderr, "zarvo_recorder: %s\n", line.c_str());
}

}  // namespace recorder

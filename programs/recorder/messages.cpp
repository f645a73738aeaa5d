// Passes lines for standard error to the main thread.
#include "messages.h"

#include <cstdio>
#include <ctime>

namespace recorder {

std::string time_text(std::int64_t time) {
  const std::time_t seconds = time / 1000;
  std::tm local{};
  localtime_r(&seconds, &local);
  char text[32];
  std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &local);
  return text;
}

void Messages::add(const std::string &line, std::int64_t time) {
  const std::lock_guard lock(mutex_);
  if (lines_.size() < kMost) lines_.push_back(time_text(time) + " " + line);
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

// Prints messages on standard error.
#include "message.h"

#include <array>
#include <cstdarg>
#include <cstdio>

#include "files.h"

namespace virtual_card {

void print_message(const char *format, ...) {
  const FileLimitFails no_signal;
  std::array<char, 8192> text;  // two paths
  std::va_list arguments;
  va_start(arguments, format);
  std::vsnprintf(text.data(), text.size(), format, arguments);
  va_end(arguments);
  std::fprintf(stderr, "virtual card: %s\n", text.data());
}

}  // namespace virtual_card

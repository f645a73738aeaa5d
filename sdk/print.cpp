// Prints lines that are visible at once.
#include "print.h"

#include <cstdarg>
#include <cstdio>

namespace zarvo {

void print(const char *format, ...) {
  va_list arguments;
  va_start(arguments, format);
  std::vprintf(format, arguments);
  va_end(arguments);
  std::fflush(stdout);
}

}  // namespace zarvo

// Removes this library from LD_PRELOAD.
#include "preload.h"

#include <dlfcn.h>
#include <unistd.h>

#include <cstring>

namespace virtual_card {
namespace {

const char *base_name(const char *path) {
  const char *slash = std::strrchr(path, '/');
  return slash == nullptr ? path : slash + 1;
}

/// Removes the entries of a list whose file name is `name`; returns true when no entry is left. Edits the
/// list in place, which is possible because it only gets shorter: a host that keeps pointers to its
/// environment sees the change too.
bool remove_from_list(char *list, const char *name) {
  const std::size_t length = std::strlen(name);
  char *to = list;
  for (const char *from = list; *from != '\0';) {
    const std::size_t size = std::strcspn(from, ": ");
    const char *end = from + size;
    const bool is_it = size >= length && std::strncmp(end - length, name, length) == 0 &&
                       (size == length || end[-static_cast<std::ptrdiff_t>(length) - 1] == '/');
    if (!is_it && size > 0) {
      if (to != list) *to++ = ':';
      std::memmove(to, from, size);
      to += size;
    }
    from = *end == '\0' ? end : end + 1;
  }
  *to = '\0';
  return to == list;
}

}  // namespace

void leave_preload_list() {
  constexpr char kVariable[] = "LD_PRELOAD=";
  Dl_info library{};
  if (dladdr(reinterpret_cast<const void *>(&leave_preload_list), &library) == 0 || environ == nullptr)
    return;
  for (char **entry = environ; *entry != nullptr; ++entry) {
    if (std::strncmp(*entry, kVariable, sizeof kVariable - 1) != 0) continue;
    if (!remove_from_list(*entry + sizeof kVariable - 1, base_name(library.dli_fname))) continue;
    for (char **place = entry; *place != nullptr; ++place) *place = place[1];
    return;
  }
}

}  // namespace virtual_card

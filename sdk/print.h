/**
 * @file print.h
 * How the SDK prints its lines.
 */
#ifndef ZV_PRINT_H
#define ZV_PRINT_H

namespace zarvo {

/// Prints to standard output and flushes it: a reader of a pipe sees the line at once, whatever buffering the
/// host has chosen, and it is not lost when the process ends without flushing.
__attribute__((format(printf, 1, 2))) void print(const char *format, ...);

}  // namespace zarvo

#endif

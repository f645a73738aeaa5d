/**
 * @file open.h
 * Opens a recording for writing.
 */
#ifndef RECORDING_OPEN_H
#define RECORDING_OPEN_H

#include <cstdio>
#include <string>

namespace recording {

/// Creates or truncates a file. Unbuffered: each fwrite() is one write, so that what a callback was given is
/// in the file when it returns, even if the process is killed afterwards. Null when the file cannot be
/// opened.
std::FILE *open_unbuffered(const std::string &path);

}  // namespace recording

#endif

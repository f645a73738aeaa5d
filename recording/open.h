/**
 * @file open.h
 * Opens a recording for writing.
 */
#ifndef RECORDING_OPEN_H
#define RECORDING_OPEN_H

#include <cstdio>
#include <string>

namespace recording {

/// Creates or truncates a file. Returns null when it cannot be opened, also when its name is that of a
/// symbolic link; folders may be links. The stream is unbuffered: each fwrite() is one write(), so the data
/// of a callback are in the file when the callback returns, even if the process is killed afterwards.
std::FILE *open_unbuffered(const std::string &path);

}  // namespace recording

#endif

/**
 * @file recording_files.h
 * What the recording control needs from the recording files besides the dialog's own functions.
 */
#ifndef RECORDING_FILES_H
#define RECORDING_FILES_H

#include <cstddef>
#include <ctime>

/// Longest root of the recordings, bytes: the longest path below it has 36 bytes more and fits, with
/// its end, into 256.
inline constexpr std::size_t kMaxRootBytes = 219;

/// The local wall clock. GUI thread only.
std::tm local_clock();

#endif

/**
 * @file tree.h
 * The folder tree of the recordings and the names in it: ROOT/Video/YYYYMMDD/CHnn/YYYYMMDD-HH.rec and
 * ROOT/Audio/YYYYMMDD/CHnn/YYYYMMDD-HH.aud, in local time. Channels count from 0 here and from 1 in names.
 */
#ifndef RECORDING_TREE_H
#define RECORDING_TREE_H

#include <cstddef>
#include <ctime>
#include <string>

namespace recording {

enum class Kind { video, audio };

/// Longest root in bytes: the longest path below it is 36 bytes longer and fits, with its end, into 256.
inline constexpr std::size_t kMaxRootBytes = 219;

/// The local wall clock. Any thread.
std::tm local_time();

std::string day_folder(const std::string &root, Kind kind, const std::tm &time);
std::string channel_folder(const std::string &day_folder, unsigned channel);
/// With the extension of the kind, ".rec" or ".aud".
std::string file_name(Kind kind, const std::tm &time);

/// Makes the folders of a kind and a day with all channel folders, where they are missing. The root must
/// exist. A folder that cannot be made shows when a file in it cannot be opened.
void make_day_folder(const std::string &root, Kind kind, const std::tm &time);

}  // namespace recording

#endif

/**
 * @file tree.h
 * The folders and file names of recordings: ROOT/Video/YYYYMMDD/CHnn/YYYYMMDD-HH.rec and
 * ROOT/Audio/YYYYMMDD/CHnn/YYYYMMDD-HH.aud, in local time. Channels count from 0 in arguments and from 1 in
 * names.
 */
#ifndef RECORDING_TREE_H
#define RECORDING_TREE_H

#include <cstddef>
#include <ctime>
#include <optional>
#include <string>

namespace recording {

enum class Kind { video, audio };

/// The longest root in bytes. The longest path below it is 36 bytes longer and fits, with its terminator,
/// into 256 bytes.
inline constexpr std::size_t kMaxRootBytes = 219;

/// Returns the local wall-clock time. Any thread.
std::tm local_time();

/// Returns ROOT/Video or ROOT/Audio.
std::string kind_folder(const std::string &root, Kind kind);
std::string day_folder(const std::string &root, Kind kind, const std::tm &time);
std::string channel_folder(const std::string &day_folder, unsigned channel);
/// Returns an hour as the names of its files begin: "20090303-14".
std::string hour_name(const std::tm &time);
/// Returns the name of a file, with the extension of its kind, ".rec" or ".aud". The further parts of an hour
/// have their number in front of the extension: "20090303-14.1.rec".
std::string file_name(Kind kind, const std::tm &time, unsigned part = 0);

/// What the name of a file tells.
struct NamedHour {
  std::tm hour{};  ///< local date and hour
  unsigned part = 0;
  std::string extension;  ///< what follows, with its dot
};
/// Reads a name as file_name() makes it, with any extension. Returns none for another name.
std::optional<NamedHour> parse_file_name(const std::string &name);
/// Returns the channel of a folder such as "CH03"; none for another name.
std::optional<unsigned> parse_channel_folder(const std::string &name);
/// Returns the extension of the files of a kind, with its dot.
std::string extension_of(Kind kind);

/// Creates the folders of a kind and a day, with all channel folders, if they are missing. The root must
/// exist. Returns 0 or the errno of the first folder that cannot be created.
int make_day_folder(const std::string &root, Kind kind, const std::tm &time);

}  // namespace recording

#endif

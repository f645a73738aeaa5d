/**
 * @file disk_space.h
 * How much of the disk is free, and the deletion of the oldest recordings.
 */
#ifndef RECORDER_DISK_SPACE_H
#define RECORDER_DISK_SPACE_H

#include <optional>
#include <set>
#include <string>

namespace recorder {

/// Returns how much of the disk of a folder is free for this user, in percent; none if the system does not
/// tell.
std::optional<double> free_percent(const std::string &folder);

/// Deletes all recordings of the oldest hour below a root, with their indexes, and the folders that are then
/// empty; no other files. `kept` names hours that stay, as "20261125-14". Returns the hour, or an empty text
/// if there is none to delete.
std::string delete_oldest_hour(const std::string &root, const std::set<std::string> &kept);

}  // namespace recorder

#endif

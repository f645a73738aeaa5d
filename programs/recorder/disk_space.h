/**
 * @file disk_space.h
 * How much of the disk is free, and the deletion of the oldest recordings.
 */
#ifndef RECORDER_DISK_SPACE_H
#define RECORDER_DISK_SPACE_H

#include <chrono>
#include <optional>
#include <set>
#include <string>

namespace recorder {

/// Returns how much of the disk of a folder is free for this user, in percent; none if the system does not
/// tell.
std::optional<double> free_percent(const std::string &folder);

/// After a deletion the next waits: a file system can free space late, and a file that is being read keeps
/// its space.
struct DeletionPause {
  std::chrono::steady_clock::time_point end;
  double free = 100;  ///< percent at the deletion

  /// Whether the deletion has freed space, or has had its time.
  bool is_over(std::chrono::steady_clock::time_point now, double free_now) const {
    return now >= end || free_now > free;
  }
};

/// Deletes all recordings of the oldest hour below a root, with their indexes, and the folders that are then
/// empty; no other files. `kept` names hours that stay, as "20261125-14". Returns the hour, or an empty text
/// if there is none to delete.
std::string delete_oldest_hour(const std::string &root, const std::set<std::string> &kept);

}  // namespace recorder

#endif

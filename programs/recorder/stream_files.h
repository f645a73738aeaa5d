/**
 * @file stream_files.h
 * The files of a stream: one an hour, with its index. Belongs to the writer's thread.
 */
#ifndef RECORDER_STREAM_FILES_H
#define RECORDER_STREAM_FILES_H

#include <cstdint>
#include <ctime>
#include <deque>
#include <string>
#include <vector>

#include "frame.h"
#include "index_writer.h"
#include "options.h"
#include "ring.h"
#include "service.h"

namespace recorder {

/// An hour of the wall clock. In autumn, when the local time repeats an hour, these are two.
struct Hour {
  std::int64_t begin = 0, end = 0;  ///< milliseconds since 1970
  std::tm local{};

  bool contains(std::int64_t time) const { return time >= begin && time < end; }
};
Hour hour_of(std::int64_t time);

/// Returns what an error of StreamFiles means.
std::string error_text(int error);

/// A file that could not be written through to the disk.
struct Unsynced {
  std::string path;
  int error;
  bool is_open;  ///< else it has ended
};

class StreamFiles {
 public:
  /// Holds the lock of the root whenever it creates a file.
  StreamFiles(const Options &options, RootLock &lock, unsigned stream);
  ~StreamFiles();
  StreamFiles(const StreamFiles &) = delete;
  StreamFiles &operator=(const StreamFiles &) = delete;

  /// Adds a frame to those that are to be written. Its memory must stay valid until it is written or dropped.
  void queue(const Ring::Taken &taken);
  bool all_written() const { return queue_.empty(); }
  /// Returns the position of the oldest frame that is not written.
  std::uint64_t oldest() const { return queue_.front().position; }

  /// Writes the frames, also into new files when the hour changes. Returns 0 or an errno: frames that are not
  /// written then stay for the next call, and the file ends with a whole frame.
  int write();
  /// Drops the frames in front of a position, and all that follow up to the next intra frame.
  void drop_until(std::uint64_t position);
  /// Returns how many frames have been dropped.
  std::uint64_t dropped() const { return dropped_; }

  /// Writes what has been written through to the disk. Returns the files that failed. If the open file is one
  /// of them, the next intra frame begins a new file.
  std::vector<Unsynced> sync();
  /// Returns an error of the index, once for each file; else 0.
  int take_index_error() { return index_.take_error(); }
  /// Ends the open file; sync() closes it, so that the writer does not wait for the disk at the change of the
  /// hour. The next intra frame begins a new file, and the frames in front of it are dropped.
  void end_file();
  /// Returns ENOENT, once, if the file is no longer in its folder. The next intra frame then begins a new
  /// file. If the file was deleted, the frames until then are dropped. Call it every second.
  int check_place();
  /// Whether a file is open, and stays open at the next intra frame of its hour.
  bool in_place() const { return is_open() && !replace_; }
  /// Ends the file at a time, when the stream has been silent for so long. `lost` is how many frames found
  /// the buffer full since the last frame. Returns the files that could not be synced.
  std::vector<Unsynced> finish(std::int64_t time, std::uint32_t silence_ms, std::uint32_t lost);
  /// Adds an event to the index.
  void note_disk_error(std::int64_t time, int error);

  /// Returns the path of the file, or of the one that could not be created.
  const std::string &path() const { return path_; }
  bool is_open() const { return file_ >= 0; }
  /// Returns the hour of the open file.
  const Hour &hour() const { return hour_; }

 private:
  bool belongs_here(const Frame &frame) const;
  int change_file(const Frame &first);
  int create_part();
  int begin_file(std::int64_t time);
  int create_index(std::int64_t time);
  int write_batch();
  void skip_group();
  void sync_folders() const;

  const Options &options_;
  RootLock &lock_;
  const unsigned stream_;
  std::deque<Ring::Taken> queue_;
  bool needs_intra_ = false;  ///< frames were dropped: queue() drops all up to the next intra frame
  std::uint64_t dropped_ = 0;
  std::uint64_t told_ = 0;  ///< how many of them are in an index

  std::string path_;
  int file_ = -1;
  IndexWriter index_;
  Hour hour_;
  std::int64_t offset_ = 0;      ///< bytes of the file, whole frames only
  bool replace_ = false;         ///< the next intra frame begins a new file
  bool folder_changed_ = false;  ///< the name of the file is not yet on the disk
  struct Retired {
    int file;
    std::string path;
  };
  std::vector<Retired> retired_;  ///< files that have ended, to be synced and closed
};

}  // namespace recorder

#endif

// Creates, writes and ends the files of a stream.
#include "stream_files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/uio.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <span>

#include "recording/frame_rates.h"
#include "recording/header.h"
#include "recording/index.h"
#include "recording/tree.h"
#include "recording/wall_time.h"

namespace recorder {
namespace {

using recording::Kind;

Kind kind_of(unsigned stream) {
  return is_video(stream) ? Kind::video : Kind::audio;
}

/// Returns the number of a channel or an input, from 0.
unsigned number_of(unsigned stream) {
  return is_video(stream) ? stream : stream - ZV_CHANNELS;
}

const char *rate_label(const Options &options) {
  return recording::frame_rate_list(options.standard)[options.rate];
}

recording::IndexEntry start_entry(const Options &options) {
  recording::IndexEntry start;
  start.standard = options.standard == VIDEO_STANDARD_ZV_NTSC ? "ntsc" : "pal";
  start.rate = rate_label(options);
  start.fields = options.two_fields ? 2 : 1;
  for (unsigned input = 0; input < ZV_AUDIO_CHANNELS; ++input)
    if (options.audio >> input & 1u) start.audio.push_back(input + 1);
  return start;
}

/// Returns the time of a frame in milliseconds.
std::int64_t period_of(const Options &options, unsigned stream) {
  return std::lround(1000 / stream_rate(options, stream));
}

/// How many frames an index counts in a line at least: audio, where every block is intra, has about a line a
/// second.
std::int64_t least_group(unsigned stream) {
  constexpr std::int64_t kBlocksASecond = 62;
  return is_video(stream) ? 1 : kBlocksASecond;
}

/// Writes all pieces. Returns 0 or an errno, and how many bytes were written.
int write_all(int file, std::span<iovec> pieces, std::size_t &written) {
  while (!pieces.empty()) {
    const ssize_t result = writev(file, pieces.data(), static_cast<int>(pieces.size()));
    if (result < 0 && errno == EINTR) continue;
    if (result < 0) return errno;
    auto rest = static_cast<std::size_t>(result);
    written += rest;
    while (!pieces.empty() && rest >= pieces.front().iov_len) {
      rest -= pieces.front().iov_len;
      pieces = pieces.subspan(1);
    }
    if (pieces.empty()) break;
    pieces.front().iov_base = static_cast<char *>(pieces.front().iov_base) + rest;
    pieces.front().iov_len -= rest;
  }
  return 0;
}

int create_new(const std::string &path) {
  return open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_APPEND | O_CLOEXEC, 0666);
}

bool has_space_error(int error) {
  return error == ENOSPC || error == EDQUOT;
}

}  // namespace

Hour hour_of(std::int64_t time) {
  const std::int64_t begin = recording::hour_begin(time);
  return {begin, begin + recording::kHour, recording::local_fields(time)};
}

std::string error_text(int error) {
  return error == EWOULDBLOCK ? "another recorder uses the root" : std::strerror(error);
}

StreamFiles::StreamFiles(const Options &options, RootLock &lock, unsigned stream)
    : options_(options),
      lock_(lock),
      stream_(stream),
      index_(start_entry(options), period_of(options, stream), least_group(stream)) {}

StreamFiles::~StreamFiles() {
  end_file();
  for (const Retired &retired : retired_) close(retired.file);
}

void StreamFiles::queue(const Ring::Taken &taken) {
  if (needs_intra_ && !taken.frame->intra) {
    ++dropped_;
    return;
  }
  needs_intra_ = false;
  queue_.push_back(taken);
}

int StreamFiles::write() {
  while (!queue_.empty()) {
    const Frame &first = *queue_.front().frame;
    if (!is_open() && !first.intra) {
      drop_until(oldest());  // its file has gone
      continue;
    }
    if (!belongs_here(first))
      if (const int error = change_file(first)) return error;
    if (const int error = write_batch()) return error;
  }
  index_.write();
  return 0;
}

bool StreamFiles::belongs_here(const Frame &frame) const {
  return is_open() && (!frame.intra || (!replace_ && hour_.contains(frame.time)));
}

int StreamFiles::change_file(const Frame &first) {
  end_file();
  hour_ = hour_of(first.time);
  if (const int error = create_part()) return error;
  replace_ = false;
  const int error = begin_file(first.time);
  if (error == 0) return 0;
  unlink(path_.c_str());
  close(file_);
  file_ = -1;
  return error;
}

/// Writes the header of a new file, if it is video, and creates the index.
int StreamFiles::begin_file(std::int64_t time) {
  offset_ = 0;
  if (!is_video(stream_)) return create_index(time);
  const auto header = recording::make_header(
      options_.codec, recording::picture_size(options_.scale, options_.standard, options_.width),
      rate_label(options_), stream_);
  offset_ = sizeof header;
  errno = ENOSPC;
  return ::write(file_, &header, sizeof header) == sizeof header ? create_index(time) : errno;
}

/// Creates the first part of the hour that does not exist. Never opens a file that exists.
int StreamFiles::create_part() {
  const Kind kind = kind_of(stream_);
  const std::string folder =
      recording::channel_folder(recording::day_folder(options_.root, kind, hour_.local), number_of(stream_));
  path_ = folder + "/" + recording::file_name(kind, hour_.local);
  if (const int error = lock_.hold()) return error;
  bool folders_made = false;
  for (unsigned part = 0;;) {
    path_ = folder + "/" + recording::file_name(kind, hour_.local, part);
    const bool has_index = access(recording::index_path(path_).c_str(), F_OK) == 0;
    file_ = has_index ? -1 : create_new(path_);
    if (file_ >= 0) break;
    if (has_index || errno == EEXIST) {
      ++part;
    } else if (errno == ENOENT && !folders_made) {
      if (const int error = recording::make_day_folder(options_.root, kind, hour_.local)) return error;
      folders_made = true;
    } else {
      return errno;
    }
  }
  folder_changed_ = true;
  return 0;
}

int StreamFiles::create_index(std::int64_t time) {
  const int file = create_new(recording::index_path(path_));
  if (file < 0) return errno;
  index_.begin(file, time, offset_);
  return 0;
}

/// Writes the frames of the open file, as many as a call takes.
int StreamFiles::write_batch() {
  std::array<iovec, 256> pieces;
  std::size_t count = 0;
  for (const Ring::Taken &taken : queue_) {
    if (count == pieces.size() || (count > 0 && !belongs_here(*taken.frame))) break;
    pieces[count++] = {const_cast<u8 *>(taken.frame->data()), taken.frame->length};
  }
  std::size_t written = 0;
  const int error = write_all(file_, std::span(pieces).first(count), written);
  for (; count > 0 && queue_.front().frame->length <= written; --count) {
    const Frame &frame = *queue_.front().frame;
    index_.add_frame(frame, offset_, frame.lost + static_cast<std::uint32_t>(dropped_ - told_));
    told_ = dropped_;
    offset_ += frame.length;
    written -= frame.length;
    queue_.pop_front();
  }
  if (error == 0) return 0;
  // A part of a frame is in the file. If it cannot be taken off, or the file takes nothing any more, the file
  // ends.
  const bool whole = written == 0 || ftruncate(file_, offset_) == 0;
  if (!whole || !has_space_error(error)) skip_group();
  return error;
}

/// Ends the file, and drops what belongs to the group that it ends with: the next file begins with an intra
/// frame.
void StreamFiles::skip_group() {
  end_file();
  drop_until(oldest());
}

void StreamFiles::drop_until(std::uint64_t position) {
  bool any = !is_open();
  while (!queue_.empty() && (queue_.front().position < position || (any && !queue_.front().frame->intra))) {
    any = true;
    ++dropped_;
    queue_.pop_front();
  }
  if (any) needs_intra_ = queue_.empty();
}

void StreamFiles::note_disk_error(std::int64_t time, int error) {
  index_.add_disk_error(time, offset_, error_text(error));
}

void StreamFiles::end_file() {
  if (!is_open()) return;
  retired_.push_back({file_, path_});
  file_ = -1;
  if (const int index = index_.end(offset_); index >= 0)
    retired_.push_back({index, recording::index_path(path_)});
}

std::vector<Unsynced> StreamFiles::sync() {
  std::vector<Unsynced> failed;
  for (const auto &[file, path] : retired_) {
    if (fdatasync(file) != 0) failed.push_back({path, errno, false});
    close(file);
  }
  retired_.clear();
  // An index is synced at its end: a recording is good without the last lines. A file that is to be replaced
  // is synced at its end too, so that its error is told only once.
  if (in_place() && fdatasync(file_) != 0) {
    failed.push_back({path_, errno, true});
    replace_ = true;
  }
  if (folder_changed_) sync_folders();
  folder_changed_ = false;
  return failed;
}

int StreamFiles::check_place() {
  if (!in_place()) return 0;
  struct stat at_path {
  }, opened{};
  if (fstat(file_, &opened) != 0) return 0;
  const bool in_place = stat(path_.c_str(), &at_path) == 0 && at_path.st_ino == opened.st_ino &&
                        at_path.st_dev == opened.st_dev;
  if (in_place) return 0;
  // A file that was moved takes the rest of its group. A file that was deleted takes nothing any more.
  replace_ = true;
  if (opened.st_nlink == 0) end_file();
  return ENOENT;
}

/// Writes the names of new files and folders through to the disk.
void StreamFiles::sync_folders() const {
  for (std::string folder = path_; folder.size() > options_.root.size();) {
    folder.resize(folder.rfind('/'));
    const int file = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (file < 0) return;
    fsync(file);
    close(file);
  }
}

std::vector<Unsynced> StreamFiles::finish(std::int64_t time, std::uint32_t silence_ms, std::uint32_t lost) {
  lost += static_cast<std::uint32_t>(dropped_ - told_);
  if (is_open() && lost > 0) index_.add_last_loss(offset_, lost);
  if (is_open() && silence_ms > 0) index_.add_last_gap(time, offset_, silence_ms);
  end_file();
  return sync();
}

}  // namespace recorder

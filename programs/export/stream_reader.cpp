// Splits a video recording into groups of frames.
#include "stream_reader.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace clips {
namespace {

constexpr std::size_t kChunk = 1 << 18;

// The last byte of MPEG-4 start codes 00 00 01 xx. The stream header in front of an intra frame begins with
// kObject.
constexpr int kObject = 0x00;
constexpr int kPicture = 0xB6;
constexpr int kZeros = -1;  ///< three zero bytes: no frame contains them
constexpr int kEnd = -2;

// Second bytes of JPEG markers.
constexpr int kEndOfImage = 0xD9;
constexpr int kStartOfScan = 0xDA;
constexpr int kFirstSegment = 0xC0;

/// Whether a marker may stand between the data of a scan: a stuffed FF or a restart.
bool in_scan(int marker) {
  return marker == 0 || (marker >= 0xD0 && marker <= 0xD7);
}

}  // namespace

void Group::keep(std::size_t frames) {
  lost += sizes.size() - frames;
  sizes.resize(frames);
}

StreamReader::StreamReader(const std::string &path) : path_(path), header_(), codec_() {
  file_ = open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  struct stat info {};
  if (file_ < 0 || fstat(file_, &info) != 0) throw RecordingError(path + ": " + std::strerror(errno));
  const auto header = S_ISREG(info.st_mode) ? recording::read_header(file_) : std::nullopt;
  const auto codec = header ? recording::codec_of(*header) : std::nullopt;
  if (!codec) {
    close(file_);
    throw RecordingError(path + ": no recording header");
  }
  header_ = *header;
  codec_ = *codec;
  intra_ = recording::intra_start(codec_);
  seek(sizeof header_);
}

StreamReader::~StreamReader() {
  close(file_);
}

void StreamReader::seek(std::int64_t offset) {
  buffer_offset_ = std::max<std::int64_t>(offset, sizeof header_);
  filled_ = start_ = 0;
  ended_ = false;
}

/// Reads on. Returns false at the end of the file.
bool StreamReader::fill() {
  if (ended_) return false;
  if (buffer_.size() < filled_ + kChunk) buffer_.resize(std::max(filled_ + kChunk, 2 * buffer_.size()));
  const ssize_t got =
      pread(file_, buffer_.data() + filled_, kChunk, buffer_offset_ + static_cast<std::int64_t>(filled_));
  if (got < 0) throw RecordingError(path_ + ": " + std::strerror(errno));
  filled_ += static_cast<std::size_t>(got);
  ended_ = got == 0;
  return got > 0;
}

bool StreamReader::next(Group &group) {
  group.sizes.clear();
  group.lost = 0;
  // Move what is left to the front, but only when it is the smaller part: so each byte moves once at most.
  if (start_ > filled_ - start_) {
    std::copy(buffer_.begin() + static_cast<std::ptrdiff_t>(start_),
              buffer_.begin() + static_cast<std::ptrdiff_t>(filled_), buffer_.begin());
    buffer_offset_ += static_cast<std::int64_t>(start_);
    filled_ -= start_;
    start_ = 0;
  }
  if (!has(start_)) return false;
  group.offset = buffer_offset_ + static_cast<std::int64_t>(start_);
  std::size_t end;
  if (!at_intra())
    end = find_intra(start_ + 1);
  else
    end = codec_ == VIDEO_CODEC_ZV_MJPEG ? split_jpeg(group) : split_mpeg4(group);
  group.data = {buffer_.data() + start_, end - start_};
  group.last = !has(end);
  // has() may have moved the buffer.
  group.data = {buffer_.data() + start_, end - start_};
  start_ = end;
  return true;
}

bool StreamReader::at_intra() {
  return has(start_ + intra_.size() - 1) &&
         std::memcmp(buffer_.data() + start_, intra_.data(), intra_.size()) == 0;
}

/// Returns where the next intra frame begins, or the end of the data.
std::size_t StreamReader::find_intra(std::size_t at) {
  while (has(at + intra_.size() - 1)) {
    const std::string_view data(reinterpret_cast<const char *>(buffer_.data()), filled_);
    const std::size_t found = data.find(intra_, at);
    if (found != std::string_view::npos) return found;
    at = filled_ - (intra_.size() - 1);
  }
  return filled_;
}

/// Moves `at` to the next start code and returns its last byte, or kZeros, or kEnd.
int StreamReader::find_start_code(std::size_t &at) {
  do {
    while (at + 3 < filled_) {
      const std::uint8_t *const data = buffer_.data();
      const void *const zero = std::memchr(data + at, 0, filled_ - 3 - at);
      if (zero == nullptr) {
        at = filled_ - 3;
        break;
      }
      at = static_cast<std::size_t>(static_cast<const std::uint8_t *>(zero) - data);
      if (data[at + 1] != 0) {
        at += 2;
      } else if (data[at + 2] == 1) {
        return data[at + 3];
      } else if (data[at + 2] == 0) {
        return kZeros;
      } else {
        at += 3;
      }
    }
  } while (fill());
  return kEnd;
}

/// Finds the frames of the group that begins at start_. Returns its end.
std::size_t StreamReader::split_mpeg4(Group &group) {
  std::size_t at = start_ + intra_.size();
  std::size_t frame = start_;        // where the current frame begins
  std::optional<std::size_t> whole;  // how many frames come before the first damaged one
  bool has_picture = false;          // in the current frame
  int code;
  for (;; at += code == kZeros ? 1 : 4) {
    code = find_start_code(at);
    const bool known = code == kPicture || code == kObject || code == kEnd;
    if (!known && !whole) whole = group.sizes.size();
    if (code == kEnd || code == kObject) break;
    if (code != kPicture) continue;
    if (has_picture) {
      group.sizes.push_back(at - frame);
      frame = at;
    }
    has_picture = true;
  }
  if (!has_picture && !whole) whole = group.sizes.size();
  const std::size_t end = code == kEnd ? filled_ : at;
  group.sizes.push_back(end - frame);
  if (whole) group.keep(*whole);
  return end;
}

std::size_t StreamReader::split_jpeg(Group &group) {
  if (const auto end = end_of_jpeg()) {
    group.sizes.push_back(*end - start_);
    return *end;
  }
  group.lost = 1;
  return find_intra(start_ + 1);
}

/// Returns the end of the picture that begins at start_; none if it is damaged.
std::optional<std::size_t> StreamReader::end_of_jpeg() {
  std::size_t at = start_ + 2;
  int marker = 0;
  while (marker != kStartOfScan) {  // the segments in front of the data
    if (!has(at + 3) || buffer_[at] != 0xFF) return std::nullopt;
    marker = buffer_[at + 1];
    if (marker < kFirstSegment || (marker >= 0xD0 && marker <= kEndOfImage)) return std::nullopt;
    at += 2 + (std::size_t{buffer_[at + 2]} << 8 | buffer_[at + 3]);
  }
  while (has(at + 1)) {
    const void *const found = std::memchr(buffer_.data() + at, 0xFF, filled_ - 1 - at);
    if (found == nullptr) {
      at = filled_ - 1;
      continue;
    }
    at = static_cast<std::size_t>(static_cast<const std::uint8_t *>(found) - buffer_.data());
    marker = buffer_[at + 1];
    at += 2;
    if (marker == kEndOfImage) return at;
    if (!in_scan(marker)) return std::nullopt;
  }
  return std::nullopt;
}

}  // namespace clips

/**
 * @file export_tree.h
 * A small tree of recordings for tests of zarvo_export, and what is in a clip of them.
 */
#ifndef TESTS_EXPORT_TREE_H
#define TESTS_EXPORT_TREE_H

#include <gmock/gmock.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "programs/export/make_clip.h"
#include "programs/export/muxer.h"
#include "recording/index.h"

namespace clips {

namespace fs = std::filesystem;
using recording::IndexEntry;
using Kind = IndexEntry::Kind;

/// Pictures or audio blocks that follow each other without a gap, from a local time such as "14:00:02.100"
/// on.
struct Burst {
  std::string time;
  int pieces;
  int motion = 0;  ///< of each group
};

/// Channel 3 records pictures of 25 a second, and input 2 records audio, on 2026-11-25. Each picture and each
/// block has a number, which tells them apart in a clip.
class ExportTree : public testing::Test {
 protected:
  ExportTree() {
    setenv("TZ", "Europe/Berlin", 1);
    tzset();
    av_log_set_level(AV_LOG_QUIET);
    fs::remove_all(root_);
    fs::create_directories(video("").parent_path());
    fs::create_directories(audio("").parent_path());
  }
  ~ExportTree() override {
    fs::remove_all(root_);
    unsetenv("TZ");
    tzset();
  }

  fs::path video(const std::string &name) const { return root_ / "Video/20261125/CH03" / name; }
  fs::path audio(const std::string &name) const { return root_ / "Audio/20261125/CH02" / name; }

  static Milliseconds at(std::string time) {
    const std::size_t point = time.find('.');
    const Milliseconds rest = point == std::string::npos ? 0 : std::stoi(time.substr(point + 1));
    if (time.find('-') == std::string::npos) time = "2026-11-25 " + time;
    return parse_time("", time.substr(0, time.find('.')), Pass::first) + rest;
  }

  /// Writes a recording whose groups have `group` pictures each, with its index. JPEG pictures for 1, else
  /// MPEG-4. Between two bursts is a gap.
  void record(const std::string &name, const std::vector<Burst> &bursts, int group = 1) {
    RECORD_FILE_HEADER header{{}, 352, 288, 25, "Channel 3"};
    std::memcpy(header.codec_tag, group == 1 ? "MJPG" : "MPG4", 4);
    std::string content(reinterpret_cast<const char *>(&header), sizeof header);
    write(video(name + ".rec"), content, bursts, 40 / fields_, group, [&](bool intra) {
      const std::string number = "#" + std::to_string(next_picture_++) + "." + std::string(pad_, 'x');
      using namespace std::string_literals;
      if (group == 1) return "\xFF\xD8\xFF\xDB\0\4ab\xFF\xDA\0\3c"s + number + "\xFF\xD9"s;
      return (intra ? "\0\0\1\0\0\0\1\x20stream head."s : ""s) + "\0\0\1\xB6"s + number;
    });
  }
  void record_audio(const std::string &name, const std::vector<Burst> &bursts) {
    write(audio(name + ".aud"), "", bursts, 16, 62, [&](bool) {
      std::string block = "#" + std::to_string(next_block_++) + ".";
      block.resize(48);
      return block;
    });
  }

  /// Makes a clip of a range of channel 3. Returns what is in it: "0-24@0 25-30@3000" says that pictures 0 to
  /// 24 are shown from the beginning, one behind the other, and 25 to 30 after three seconds. "!" follows if
  /// the clip lacks something.
  std::string clip(const std::string &from, const std::string &to, bool motion = false, unsigned input = 0) {
    Options options;
    options.root = root_;
    options.channel = 3;
    options.audio = input;
    options.range = {at(from), at(to)};
    options.motion = motion;
    return made(options);
  }
  std::string made(Options options) {
    Report report;
    options.output = clip_;
    options.force = true;
    testing::internal::CaptureStderr();
    try {
      make_clip(options, report);
    } catch (const std::runtime_error &error) {
      report.skipped(error.what());
      fs::remove(clip_);
    }
    lines_ = testing::internal::GetCapturedStderr();
    return (fs::exists(clip_) ? content_of_clip() : "") + (report.complete() ? "" : " !");
  }

  static void touch(const fs::path &path, const std::string &time) {
    const timespec stamp{at(time) / 1000, at(time) % 1000 * 1000000}, stamps[] = {stamp, stamp};
    ASSERT_EQ(utimensat(AT_FDCWD, path.c_str(), stamps, 0), 0);
  }

  const fs::path root_ = testing::TempDir() + "export_tree." + std::to_string(getpid());
  std::string clip_ = root_ / "clip.mkv";
  std::string lines_;     ///< on standard error
  std::string audio_;     ///< the audio of the last clip, as clip() returns the pictures
  std::string shape_;     ///< of its pictures
  int fields_ = 1;        ///< of each picture, for record()
  std::size_t pad_ = 10;  ///< bytes of a picture that say nothing

 private:
  template <typename Make>
  void write(const fs::path &path, std::string content, const std::vector<Burst> &bursts, Milliseconds period,
             int group, const Make &make) {
    std::ofstream index(recording::index_path(path));
    IndexEntry entry;
    const auto add = [&](Kind kind, Milliseconds time) {
      entry.kind = kind;
      entry.time = time;
      entry.offset = static_cast<std::int64_t>(content.size());
      index << to_line(entry);
    };
    entry.standard = "pal";
    entry.rate = "25";
    entry.fields = fields_;
    Milliseconds end = at(bursts.front().time);
    add(Kind::start, end);
    int count = 0;
    for (const Burst &burst : bursts) {
      const Milliseconds time = at(burst.time);
      entry.ms = time - end;
      if (time > end) add(Kind::gap, time);
      if (path.extension() == ".aud") count = 0;  // a line stands behind each gap
      for (int piece = 0; piece < burst.pieces; ++piece) {
        const bool intra = count++ % group == 0;
        if (intra) add(Kind::intra, time + piece * period);
        entry.motion = burst.motion;
        content += make(intra);
      }
      end = time + burst.pieces * period;
    }
    add(Kind::stop, end);
    std::ofstream(path, std::ios::binary) << content;
  }

  std::string content_of_clip() {
    AVFormatContext *file = nullptr;
    if (avformat_open_input(&file, clip_.c_str(), nullptr, nullptr) < 0) return "no clip";
    std::vector<std::pair<int, Milliseconds>> pieces[2];  // numbers and times, of pictures and of audio
    const libav::PacketOwner packet(av_packet_alloc());
    for (; av_read_frame(file, packet.get()) >= 0; av_packet_unref(packet.get())) {
      const AVRational base = file->streams[packet->stream_index]->time_base;
      const char *const data = reinterpret_cast<const char *>(packet->data);
      const char *const mark = std::find(data, data + packet->size, '#');
      pieces[packet->stream_index].emplace_back(mark < data + packet->size ? std::atoi(mark + 1) : -1,
                                                av_rescale(packet->pts, base.num * 1000, base.den));
    }
    const AVStream &stream = *file->streams[0];
    const AVRational shape =
        av_mul_q(stream.sample_aspect_ratio, {stream.codecpar->width, stream.codecpar->height});
    shape_ = std::to_string(shape.num) + ":" + std::to_string(shape.den);
    avformat_close_input(&file);
    audio_ = runs_of(pieces[1], 16);
    return runs_of(pieces[0], 40 / fields_);
  }

  static std::string runs_of(const std::vector<std::pair<int, Milliseconds>> &pieces, Milliseconds period) {
    std::ostringstream text;
    for (std::size_t first = 0, end; first < pieces.size(); first = end) {
      const auto [number, time] = pieces[first];
      for (end = first + 1; end < pieces.size(); ++end) {
        const int count = static_cast<int>(end - first);
        if (pieces[end] != std::pair(number + count, time + count * period)) break;
      }
      text << (first == 0 ? "" : " ") << number << "-" << pieces[end - 1].first << "@" << time;
    }
    return text.str();
  }

  int next_picture_ = 0, next_block_ = 0;
};

}  // namespace clips

#endif

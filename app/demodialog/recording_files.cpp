/// The folder tree, the names, the header and the opening and closing of the recording files.
#include "recording_files.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "app_state.h"
#include "demodialog.h"
#include "qualities.h"
#include "record_file_header.h"

namespace {

/// Makes a folder unless there is one. What cannot be made shows when a file in it cannot be opened.
void make_folder(const std::string &path) {
  mkdir(path.c_str(), 0777);
}

std::string day_name(const std::tm &now) {
  char text[48];
  std::snprintf(text, sizeof text, "%d%02d%02d", now.tm_year + 1900, now.tm_mon + 1, now.tm_mday);
  return text;
}

std::string file_name(const std::tm &now, const char *extension) {
  char hour[16];
  std::snprintf(hour, sizeof hour, "-%02d", now.tm_hour);
  return day_name(now) + hour + extension;
}

std::string channel_folder(const std::string &day_path, unsigned index) {
  char name[16];
  std::snprintf(name, sizeof name, "/CH%02u", index + 1);
  return day_path + name;
}

/// Makes the day's folder of one kind with its channel folders and keeps its path.
void make_day(const std::string &day_path, unsigned channels, char (&kept)[256]) {
  std::snprintf(kept, sizeof kept, "%s", day_path.c_str());
  make_folder(day_path);
  for (unsigned index = 0; index < channels; ++index) make_folder(channel_folder(day_path, index));
}

/// Opens a recording file anew. Unbuffered: each delivery is one write, and what a callback has been
/// given is in the file when it returns, whatever happens to the process afterwards. Null when there is
/// no day folder.
FILE *open_recording(const char *day_path, unsigned index, const std::string &name) {
  if (*day_path == '\0') return nullptr;
  // Without O_NONBLOCK a pipe in the file's place would hold the dialog until somebody reads it.
  const int file = open((channel_folder(day_path, index) + "/" + name).c_str(),
                        O_WRONLY | O_CREAT | O_TRUNC | O_NONBLOCK | O_CLOEXEC, 0666);
  FILE *const stream = file < 0 ? nullptr : fdopen(file, "w");
  if (stream) std::setvbuf(stream, nullptr, _IONBF, 0);
  return stream;
}

void close_entry(FILE *&entry) {
  if (entry) std::fclose(entry);
  entry = nullptr;
}

/// Size of the picture that is recorded; "None" keeps the size recorded last.
void update_record_size(ZV_SCALE_VALUE scale) {
  if (scale == SCALE_ZV_NO_ENCODE) return;
  g_record_width = scale == SCALE_ZV_CIF ? 352 : input_width();
  g_record_height = scale == SCALE_ZV_D1 ? input_lines() : input_lines() / 2;
}

}  // namespace

std::tm local_clock() {
  const std::time_t now = std::time(nullptr);
  const std::tm *const fields = std::localtime(&now);
  return fields ? *fields : std::tm{};
}

void DemoDialog::CheckFolder(char *root) {
  const std::string base = root;
  if (base.size() > kMaxRootBytes) {
    g_video_path[0] = g_audio_path[0] = '\0';
    return;
  }
  const std::string video = base + "/Video";
  const std::string audio = base + "/Audio";
  make_folder(video);
  make_folder(audio);
  const std::string day = "/" + day_name(local_clock());
  make_day(video + day, ZV_CHANNELS, g_video_path);
  make_day(audio + day, ZV_AUDIO_CHANNELS, g_audio_path);
}

void DemoDialog::OpenFile() {
  FILE **const table = comboCodec->currentIndex() == 0 ? g_fp_mpg4 : g_fp_mjpg;
  const std::tm now = local_clock();
  g_cur_hour = now.tm_hour;
  const std::string video_name = file_name(now, ".rec");
  for (unsigned i = 0; i < ZV_CHANNELS; ++i) {
    table[i] = g_record_ch >> i & 1u ? open_recording(g_video_path, i, video_name) : nullptr;
    if (table[i]) WriteHeader(table[i], static_cast<int>(i));
  }
  const std::string audio_name = file_name(now, ".aud");
  for (unsigned i = 0; i < ZV_AUDIO_CHANNELS; ++i) {
    g_fp_audio[i] = g_audio_ch >> i & 1u ? open_recording(g_audio_path, i, audio_name) : nullptr;
  }
}

void DemoDialog::CloseFile() {
  for (unsigned i = 0; i < ZV_CHANNELS; ++i) {
    close_entry(g_fp_mpg4[i]);
    close_entry(g_fp_mjpg[i]);
  }
  for (FILE *&entry : g_fp_audio) close_entry(entry);
}

void DemoDialog::WriteHeader(FILE *fp, int ch) {
  RECORD_FILE_HEADER header{};
  header.frame_rate = static_cast<std::int32_t>(comboFrameRate->currentText().toDouble());
  const char *const tag = zv_record_mode == VIDEO_CODEC_ZV_MJPEG ? kMjpegTag : kMpeg4Tag;
  std::memcpy(header.codec_tag, tag, sizeof header.codec_tag);
  update_record_size(quality_of(comboQualityMode->currentIndex()).scale);
  header.record_width = g_record_width;
  header.record_height = g_record_height;
  const std::string label = "Channel " + std::to_string(ch + 1);
  label.copy(header.channel_label, sizeof header.channel_label);
  std::fwrite(&header, sizeof header, 1, fp);
}

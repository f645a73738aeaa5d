// The recording files of the dialog: creates the folders, opens the files of an hour, writes their headers
// and closes them.
#include <cstdio>
#include <string>

#include "app_state.h"
#include "demodialog.h"
#include "qualities.h"
#include "recording/header.h"
#include "recording/open.h"
#include "recording/tree.h"

namespace {

using recording::Kind;

/// Creates the day's folders of a kind and stores the path of the day's folder.
void make_day(const std::string &root, Kind kind, const std::tm &now, char (&kept)[256]) {
  recording::make_day_folder(root, kind, now);
  std::snprintf(kept, sizeof kept, "%s", recording::day_folder(root, kind, now).c_str());
}

/// Opens a recording file. Returns null when it cannot be opened or there is no day folder.
FILE *open_file(const char *day_path, unsigned index, const std::string &name) {
  if (*day_path == '\0') return nullptr;
  return recording::open_unbuffered(recording::channel_folder(day_path, index) + "/" + name);
}

void close_entry(FILE *&entry) {
  if (entry) std::fclose(entry);
  entry = nullptr;
}

/// Stores the size of the recorded picture. "None" does not change the size.
void update_record_size(ZV_SCALE_VALUE scale) {
  if (scale == SCALE_ZV_NO_ENCODE) return;
  const auto [width, height] = recording::picture_size(scale, zv_format, zv_resolution);
  g_record_width = width;
  g_record_height = height;
}

}  // namespace

void DemoDialog::CheckFolder(char *root) {
  const std::string base = root;
  if (base.size() > recording::kMaxRootBytes) {
    g_video_path[0] = g_audio_path[0] = '\0';
    return;
  }
  const std::tm now = recording::local_time();
  make_day(base, Kind::video, now, g_video_path);
  make_day(base, Kind::audio, now, g_audio_path);
}

void DemoDialog::OpenFile() {
  FILE **const table = comboCodec->currentIndex() == 0 ? g_fp_mpg4 : g_fp_mjpg;
  const std::tm now = recording::local_time();
  g_cur_hour = now.tm_hour;
  const std::string video_name = recording::file_name(Kind::video, now);
  for (unsigned i = 0; i < ZV_CHANNELS; ++i) {
    table[i] = g_record_ch >> i & 1u ? open_file(g_video_path, i, video_name) : nullptr;
    if (table[i]) WriteHeader(table[i], static_cast<int>(i));
  }
  const std::string audio_name = recording::file_name(Kind::audio, now);
  for (unsigned i = 0; i < ZV_AUDIO_CHANNELS; ++i) {
    g_fp_audio[i] = g_audio_ch >> i & 1u ? open_file(g_audio_path, i, audio_name) : nullptr;
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
  update_record_size(quality_of(comboQualityMode->currentIndex()).scale);
  const RECORD_FILE_HEADER header =
      recording::make_header(zv_record_mode, {g_record_width, g_record_height},
                             comboFrameRate->currentText().toStdString(), static_cast<unsigned>(ch));
  std::fwrite(&header, sizeof header, 1, fp);
}

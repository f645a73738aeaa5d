// Starts and stops a recording, starts new files every hour, reads the three recording settings, and has the
// callbacks that write the files.
#include <sys/stat.h>
#include <sys/vfs.h>
#include <unistd.h>

#include <QByteArray>
#include <QFile>
#include <algorithm>
#include <climits>
#include <cstdio>
#include <cstring>

#include "app_state.h"
#include "demodialog.h"
#include "panel_helpers.h"
#include "recording/tree.h"
#include "zv_lib.h"

namespace {

constexpr const char *kNoSpace = "No enough disk space";

constexpr int kBytesPerKilobit = 1024 / 8;

/// Appends data to the open file with this index. Returns false when no such file is open. The GUI thread
/// opens the files before capture starts and closes them after it has ended, so no lock is needed.
template <std::size_t N>
bool append(FILE *const (&files)[N], unsigned index, const unsigned char *data, int length) {
  if (index >= N || !files[index]) return false;
  if (length > 0) std::fwrite(data, static_cast<std::size_t>(length), 1, files[index]);
  return true;
}

/// Returns whether a path is a folder that this process can enter, and short enough for all paths below it.
bool is_root(const QByteArray &path) {
  if (static_cast<std::size_t>(path.size()) > recording::kMaxRootBytes || path.contains('\0')) return false;
  struct stat info {};
  return stat(path.constData(), &info) == 0 && S_ISDIR(info.st_mode) && access(path.constData(), X_OK) == 0;
}

/// Returns the number in the edit of a recording setting. Replaces a number out of range, or no number, by
/// 10 in the edit.
int setting_in(QLineEdit *edit, int lowest, int highest) {
  constexpr int kFallback = 10;
  const int value = number_in(edit);
  if (value >= lowest && value <= highest) return value;
  edit->setText(QString::number(kFallback));
  return kFallback;
}

}  // namespace

void mpeg4_call_back(unsigned int ch, unsigned char *data, int length, int) {
  if (!append(g_fp_mpg4, ch, data, length)) return;
  // lenlen counts this second's bytes; it stops at INT_MAX in case nothing resets it.
  lenlen =
      static_cast<int>(std::min<long long>(static_cast<long long>(lenlen) + std::max(length, 0), INT_MAX));
  const std::time_t now = std::time(nullptr);
  if (now == ttt) return;
  ttt = now;
  std::printf("%dkbps\n", lenlen / kBytesPerKilobit);
  lenlen = 0;
}

void mjpeg_call_back(unsigned int ch, unsigned char *data, int length, int) {
  append(g_fp_mjpg, ch, data, length);
}

void audio_call_back(unsigned int ch, unsigned char *data, int length, int) {
  append(g_fp_audio, ch, data, length);
}

void DemoDialog::StartRecord() {
  // A second start would truncate the files that the capture threads write.
  if (timer.isActive()) return;
  if (std::strlen(g_filepath) > recording::kMaxRootBytes || !CheckDiskSpace(g_filepath)) {
    std::puts(kNoSpace);
    return;
  }
  CheckFolder(g_filepath);
  OpenFile();
  // SetQP() first: a fixed quantiser resets the bit-rate box to VBR, and SetCBRbps() reads that box.
  SetQP();
  SetCBRbps();
  SetTwoField();
  SetGOP();
  if (!WriteVideoRecordConfig()) {
    CloseFile();
    return;
  }
  WriteEnableCh();
  const int status = zv_Start(zv_handle);
  if (status != ZV_OK)
    CloseFile();  // before the error line is printed, so that the files are complete by then
  if (!sdk_ok(status, "ERROR:zv_Start Error!")) return;
  timer.start(g_time_interval);
  g_finish_record = 0;
  UpdateUI(RECORD_START);
}

void DemoDialog::StopRecord() {
  sdk_ok(zv_Stop(zv_handle), "ERROR:zv_Stop Error!");
  usleep(100);
  CloseFile();
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    zv_SetVideoEncodeConfig(zv_handle, channel, &zv_clean_config);
  }
  timer.stop();
  g_finish_record = 1;
  UpdateUI(RECORD_STOP);
}

void DemoDialog::TimerTick() {
  if (!CheckDiskSpace(g_filepath)) {
    std::puts(kNoSpace);
    StopRecord();
  }
  if (!CheckTime()) {
    std::puts("Hour changed");
    StopRecord();
    sleep(1);
    StartRecord();
  }
}

int DemoDialog::CheckTime() {
  const int hour = recording::local_time().tm_hour;
  if (hour == g_cur_hour) return 1;
  g_cur_hour = hour;
  return 0;
}

int DemoDialog::CheckDiskSpace(char *path) {
  struct statfs disk {};
  if (statfs(path, &disk) != 0) return 0;
  if (disk.f_blocks == 0) return 1;
  const double free = 100.0 * static_cast<double>(disk.f_bfree) / static_cast<double>(disk.f_blocks);
  std::printf("Disk free percentage\t= %.2f%c\n", free, '%');
  return free >= g_min_diskspace ? 1 : 0;
}

void DemoDialog::UpdatePath() {
  const QByteArray path = QFile::encodeName(edtRecordPath->text());
  if (is_root(path)) std::memcpy(g_filepath, path.constData(), static_cast<std::size_t>(path.size()) + 1);
  edtRecordPath->setText(QFile::decodeName(g_filepath));
  UpdateDiskLimit();
  UpdateTimeInterval();
}

void DemoDialog::UpdateDiskLimit() {
  g_min_diskspace = setting_in(edtDiskLimit, 10, 100);
}

void DemoDialog::UpdateTimeInterval() {
  g_time_interval = setting_in(edtTime, 1, 59) * 1000;
}

// The encode panel: one encoder configuration for all recorded channels, and the number of channels that its
// quality allows.
#include <unistd.h>

#include <cstdio>
#include <iterator>

#include "app_state.h"
#include "demodialog.h"
#include "panel_helpers.h"
#include "qualities.h"
#include "zv_lib.h"

namespace {

constexpr u32 kDefaultQp = 4;
constexpr u32 kDefaultGop = 30;
constexpr i32 kKilo = 1024;
constexpr i32 kMega = 1048576;

// The values of the items of the combo boxes. 0 belongs to the first item, which chooses no value.
constexpr u32 kQuantisers[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 30};
constexpr i32 kBitRates[] = {0,         64 * kKilo, 128 * kKilo, 256 * kKilo, 512 * kKilo,
                             1 * kMega, 2 * kMega,  3 * kMega,   4 * kMega,   5 * kMega,
                             6 * kMega, 7 * kMega,  8 * kMega,   9 * kMega,   10 * kMega};
constexpr u32 kGops[] = {kDefaultGop, 1, 2, 3, 5, 10, 15, 20, 25, 30};
constexpr ZV_JPEG_QUALITY kJpegQualities[] = {JPEG_QP_ZV_LOW, JPEG_QP_ZV_HIGH};

// The highest upper bound of the quantiser, and the bounds stored when the operator enters none.
constexpr int kHighestQpMax = 59;
constexpr u32 kDefaultQpMax = 15;
constexpr u32 kDefaultQpMin = 2;

/// The texts of edtScale, by ZV_SCALE_VALUE.
const char *const kScaleNames[] = {
    QT_TRANSLATE_NOOP("DemoDialog", "No Encoding"), QT_TRANSLATE_NOOP("DemoDialog", "Half D1"),
    QT_TRANSLATE_NOOP("DemoDialog", "CIF"), QT_TRANSLATE_NOOP("DemoDialog", "D1")};

ZV_VIDEO_CODEC codec_of(const QComboBox *combo) {
  return combo->currentIndex() == 0 ? VIDEO_CODEC_ZV_MPEG4 : VIDEO_CODEC_ZV_MJPEG;
}

ZV_TWOFIELD_MODE field_mode_of(const QComboBox *combo) {
  return combo->currentIndex() == 0 ? TWOFIELD_DISABLE : TWOFIELD_ENABLE;
}

void hold_no_bit_rate() {
  zv_config.CBREnable = 0;
  zv_config.CBRValue = 0;
}

void keep_quantiser_range(u32 enable, u32 max, u32 min) {
  zv_config.QPMinMaxEnable = enable;
  zv_config.QPMax = max;
  zv_config.QPMin = min;
}

/// Disables recording, since the operator has chosen "None".
void switch_recording_off(DemoDialog &dialog) {
  for (QRadioButton *mode : {dialog.radioEnRecord, dialog.radioEnAudio}) {
    mode->setEnabled(false);
    uncheck(mode);
  }
  dialog.combowTwoField->setEnabled(true);
  g_valid_record_ch = 0;
  g_record_ch = 0;
  g_channel_mode = INITIAL_CASE;
  dialog.SetCheckBox(0);
  dialog.ChecksGroup->setTitle(QString());
  dialog.btnRecordStart->setEnabled(false);
  dialog.btnRecordStop->setEnabled(false);
}

/// Stores the picture size, and the field mode and the channels that it allows.
void choose_quality(DemoDialog &dialog, const Quality &quality) {
  const bool d1 = quality.scale == SCALE_ZV_D1;
  if (d1) dialog.combowTwoField->setCurrentIndex(0);
  dialog.combowTwoField->setEnabled(!d1);
  zv_config.scale = quality.scale;
  zv_config.twofield = field_mode_of(dialog.combowTwoField);
  g_valid_record_ch = allowed_channels(quality, zv_config.twofield);
  g_record_ch = (1u << g_valid_record_ch) - 1u;
  dialog.btnRecordStart->setEnabled(true);
}

/// Makes the boxes show and edit the record set.
void show_record_set(DemoDialog &dialog) {
  dialog.radioEnRecord->setEnabled(true);
  dialog.radioEnAudio->setEnabled(true);
  dialog.radioEnRecord->setChecked(true);
  dialog.ChecksGroup->setTitle(DemoDialog::tr("Record"));
  g_channel_mode = INITIAL_CASE;
  for (QCheckBox *box : g_check_handle) box->setEnabled(true);
  dialog.SetCheckBox(g_record_ch);
  g_channel_mode = ENABLE_RECORD;
}

/// Stores the settings of all channels: the panel's settings for recorded channels, clean settings for the
/// others.
void store_configs() {
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    if (g_record_ch >> channel & 1u) {
      sdk_ok(zv_SetVideoEncodeConfig(zv_handle, channel, &zv_config), "ERROR:zv_SetVideoEncodeConfig Error!");
    } else {
      zv_SetVideoEncodeConfig(zv_handle, channel, &zv_clean_config);
    }
  }
}

/// Reads back the settings of the first channel that has a scale, or of channel 16 when no channel has one.
/// Returns false when a read fails.
bool read_first_encoding(ZV_VIDEO_CONFIG &record) {
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    if (!sdk_ok(zv_GetVideoEncodeConfig(zv_handle, channel, &record),
                "ERROR:zv_GetVideoEncodeConfig Error!")) {
      return false;
    }
    if (record.scale != SCALE_ZV_NO_ENCODE) break;
  }
  return true;
}

void show_scale(QLineEdit *edit, ZV_SCALE_VALUE scale) {
  if (scale == SCALE_ZV_INVALID) {
    std::puts("ERROR:zv_GetVideoEncodeConfig Error -- SCALE_ZV_INVALID:!");
  } else if (scale < std::size(kScaleNames)) {
    edit->setText(DemoDialog::tr(kScaleNames[scale]));
  }
}

}  // namespace

void DemoDialog::InitEncodeConfig() {
  zv_config.jpeg_qp = JPEG_QP_ZV_LOW;
  zv_config.scale = SCALE_ZV_CIF;
  zv_config.gop = kDefaultGop;
  zv_config.qp = kDefaultQp;
  zv_config.interval = INTERVAL_ZV_30FPS_NTSC;
  zv_config.enable = 0;

  zv_clean_config = {};
  zv_clean_config.scale = SCALE_ZV_NO_ENCODE;
  zv_clean_config.gop = 1;
  zv_clean_config.interval = INTERVAL_ZV_INVALID;
}

void DemoDialog::UpdateEncodeInfo() {
  for (QLineEdit *result : {edtScale, edtFrameRate, edtQuallity, edtBitRate}) result->setText(QString());
  const Quality quality = quality_of(comboQualityMode->currentIndex());
  if (quality.scale == SCALE_ZV_NO_ENCODE) {
    switch_recording_off(*this);
    return;
  }
  choose_quality(*this, quality);
  show_record_set(*this);
}

void DemoDialog::UpdateCodecInfo() {
  zv_config.mjpeg = codec_of(comboCodec);
  zv_record_mode = zv_config.mjpeg;
}

void DemoDialog::UpdateFrameRate() {
  const int index = comboFrameRate->currentIndex();
  if (index >= 0 && index < INTERVAL_ZV_INVALID) zv_config.interval = static_cast<ZV_INTERVAL_VALUE>(index);
}

void DemoDialog::UpdateJpegQuality() {
  zv_config.jpeg_qp = item_value(kJpegQualities, comboJpegQuality->currentIndex(), zv_config.jpeg_qp);
}

void DemoDialog::SetTwoField() {
  zv_config.twofield = field_mode_of(combowTwoField);
}

void DemoDialog::SetGOP() {
  zv_config.gop = item_value(kGops, comboGOPValue->currentIndex(), kDefaultGop);
}

// A fixed quantiser and a constant bit rate exclude each other: choosing one resets the other.
void DemoDialog::SetQP() {
  const u32 qp = item_value(kQuantisers, comboQPvalue->currentIndex(), 0u);
  if (qp == 0) {
    zv_config.qp = kDefaultQp;
    comboCBRValue->setEnabled(true);
    return;
  }
  zv_config.qp = qp;
  comboCBRValue->setCurrentIndex(0);
  hold_no_bit_rate();
}

void DemoDialog::SetCBRbps() {
  const i32 rate = item_value(kBitRates, comboCBRValue->currentIndex(), 0);
  if (rate == 0) {
    hold_no_bit_rate();
    comboQPvalue->setEnabled(true);
    return;
  }
  zv_config.CBRValue = rate;
  zv_config.CBREnable = 1;
  comboQPvalue->setCurrentIndex(0);
  zv_config.qp = kDefaultQp;
}

void DemoDialog::SetQPMinMax() {
  const int max = number_in(edtQPMax);
  const int min = number_in(edtQPMin);
  if (max <= kHighestQpMax && min >= 1 && max > min) {
    keep_quantiser_range(1, static_cast<u32>(max), static_cast<u32>(min));
  } else if (max >= 1 && max <= kHighestQpMax && min == 0) {
    keep_quantiser_range(1, static_cast<u32>(max), kDefaultQpMin);
  } else if (max == 0 && min >= 1 && static_cast<u32>(min) < kDefaultQpMax) {
    keep_quantiser_range(1, kDefaultQpMax, static_cast<u32>(min));
  } else {
    keep_quantiser_range(0, kDefaultQpMax, kDefaultQpMin);
  }
}

int DemoDialog::WriteVideoRecordConfig() {
  if (g_record_ch == 0) return 0;
  zv_config.mjpeg = codec_of(comboCodec);
  zv_config.enable = 1;
  store_configs();
  if (!sdk_ok(zv_CheckVideoEncodeConfig(zv_handle), "ERROR:zv_CheckVideoEncodeConfig Error!")) return 0;

  ZV_VIDEO_CONFIG record{};
  if (!read_first_encoding(record)) return 0;
  show_scale(edtScale, record.scale);
  edtFrameRate->setText(QString::number(record.gop));
  edtQuallity->setText(QString::number(record.qp));
  edtBitRate->setText(QString::number(static_cast<int>(record.interval)));
  usleep(300);
  return 1;
}

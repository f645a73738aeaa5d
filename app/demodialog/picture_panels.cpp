// The panels that edit one card setting each: picture properties, focus, privacy mask, motion sensitivity,
// motion areas, motion detection. Numbers go to the SDK as typed; only the SDK checks them.
#include <cstdio>
#include <cstring>
#include <mutex>

#include "app_state.h"
#include "demodialog.h"
#include "panel_helpers.h"
#include "zv_lib.h"

namespace {

/// A picture property: its edit, its slider, its member in the record and its printed line.
struct PropertyRow {
  QLineEdit *DemoDialog::*edit;
  QSlider *DemoDialog::*slider;
  i32 ZV_VIDEO_PROPERTY::*value;
  const char *line;
};

const PropertyRow kProperties[] = {
    {&DemoDialog::edtHue, &DemoDialog::sliderHue, &ZV_VIDEO_PROPERTY::hue, "Hue = %d\n"},
    {&DemoDialog::edtSaturation, &DemoDialog::sliderSaturation, &ZV_VIDEO_PROPERTY::saturation,
     "Saturation = %d\n"},
    {&DemoDialog::edtContrast, &DemoDialog::sliderContrast, &ZV_VIDEO_PROPERTY::contrast, "Contrast = %d\n"},
    {&DemoDialog::edtBrightness, &DemoDialog::sliderBrightness, &ZV_VIDEO_PROPERTY::brightness,
     "Brightness = %d\n"},
};

/// An edge of a rectangle: its edits in the mask panel and the motion area panel, its member in both records,
/// and its printed line.
struct EdgeRow {
  QLineEdit *DemoDialog::*mask_edit;
  QLineEdit *DemoDialog::*area_edit;
  u32 ZV_RECT::*edge;
  const char *line;
};

const EdgeRow kEdges[] = {
    {&DemoDialog::edtLeft, &DemoDialog::edtMLeft, &ZV_RECT::x_start, "channel %d : Left= %d\n"},
    {&DemoDialog::edtRight, &DemoDialog::edtMRight, &ZV_RECT::x_end, "channel %d : Right= %d\n"},
    {&DemoDialog::edtTop, &DemoDialog::edtMTop, &ZV_RECT::y_start, "channel %d : Top= %d\n"},
    {&DemoDialog::edtBottom, &DemoDialog::edtMBottom, &ZV_RECT::y_end, "channel %d : Bottom= %d\n"},
};

/// If the mask cannot be read, the panel shows numbers of which every byte is 9.
constexpr int kUnreadByte = 0x09;

u32 channel_of(const QComboBox *combo) {
  return static_cast<u32>(combo->currentIndex());
}

/// Returns the number in an edit as unsigned. A negative number becomes a large one, which the SDK refuses.
u32 unsigned_in(const QLineEdit *edit) {
  return static_cast<u32>(number_in(edit));
}

}  // namespace

void DemoDialog::UpdatePropertyEdt() {
  for (const PropertyRow &row : kProperties) {
    (this->*row.edit)->setText(QString::number((this->*row.slider)->value()));
  }
}

void DemoDialog::UpdatePropertySlider() {
  for (const PropertyRow &row : kProperties) (this->*row.slider)->setValue(number_in(this->*row.edit));
}

void DemoDialog::GetProperty() {
  for (const PropertyRow &row : kProperties) (this->*row.edit)->setText(QString());
  zv_property = {};
  if (!sdk_ok(zv_GetVideoProperty(zv_handle, channel_of(comboProperty), &zv_property),
              "ERROR:zv_GetVideoProperty Error!")) {
    return;
  }
  for (const PropertyRow &row : kProperties) {
    (this->*row.edit)->setText(QString::number(zv_property.*row.value));
    (this->*row.slider)->setValue(number_in(this->*row.edit));
  }
}

void DemoDialog::SetProperty() {
  const u32 channel = channel_of(comboProperty);
  for (const PropertyRow &row : kProperties) {
    zv_property.*row.value = number_in(this->*row.edit);
    std::printf(row.line, zv_property.*row.value);
  }
  sdk_ok(zv_SetVideoProperty(zv_handle, channel, &zv_property), "ERROR:zv_SetVideoProperty Error!");
}

void DemoDialog::GetFocus() {
  const u32 channel = zv_GetFocusChannel(zv_handle);
  edtFocus->setText(QString::number(channel + 1));
  std::printf("Get Focus channel = %d\n", channel);
}

void DemoDialog::SetFocus() {
  const u32 channel = unsigned_in(edtFocus) - 1u;
  std::printf("Set Focus channel = %d\n", channel);
  const std::lock_guard lock(layout_mutex);
  sdk_ok(zv_SetFocusChannel(zv_handle, channel), "ERROR:zv_SetFocusChannel Error!");
}

void DemoDialog::GetShield() {
  for (const EdgeRow &row : kEdges) (this->*row.mask_edit)->setText(QString());
  std::memset(&zv_rect, kUnreadByte, sizeof zv_rect);
  sdk_ok(zv_GetShieldRect(zv_handle, channel_of(comboShield), &zv_rect), "ERROR:zv_GetShieldRect Error!");
  for (const EdgeRow &row : kEdges) (this->*row.mask_edit)->setText(QString::number(zv_rect.*row.edge));
}

void DemoDialog::SetShield() {
  for (const EdgeRow &row : kEdges) zv_rect.*row.edge = unsigned_in(this->*row.mask_edit);
  sdk_ok(zv_SetShieldRect(zv_handle, channel_of(comboShield), &zv_rect), "ERROR:zv_SetShieldRect Error!");
}

void DemoDialog::GetSensitivity() {
  const u32 channel = channel_of(comboMotion);
  u32 value = 0;
  if (!sdk_ok(zv_GetMotionSensitivity(zv_handle, channel, &value), "ERROR:zv_GetMotionSensitivity Error!")) {
    return;
  }
  std::printf("Channel %d :Get Sensitivity = %d\n", channel, value);
  edtSensitivity->setText(QString::number(value));
}

void DemoDialog::SetSensitivity() {
  const u32 channel = channel_of(comboMotion);
  const u32 value = unsigned_in(edtSensitivity);
  std::printf("Channel %d :Set Sensitivity = %d\n", channel, value);
  sdk_ok(zv_SetMotionSensitivity(zv_handle, channel, value), "ERROR:zv_SetMotionSensitivity Error!");
}

void DemoDialog::SetMotionArea() {
  for (const EdgeRow &row : kEdges) zv_rect_motion.*row.edge = unsigned_in(this->*row.area_edit);
  const u32 mark = checkMotionArea->isChecked() ? 1u : 0u;
  const u32 channel = channel_of(comboMotionArea);
  std::printf("Mark : %d\n", mark);
  for (const EdgeRow &row : kEdges) std::printf(row.line, channel, zv_rect_motion.*row.edge);
  sdk_ok(zv_MarkMotionArea(zv_handle, channel, &zv_rect_motion, mark), "ERROR:zv_MarkMotionArea Error!");
}

void DemoDialog::StartMotion() {
  sdk_ok(zv_StartMotionDetection(zv_handle), "ERROR:zv_StartMotionDetection Error!");
  UpdateUI(MOTION_START);
}

void DemoDialog::StopMotion() {
  sdk_ok(zv_StopMotionDetection(zv_handle), "ERROR:zv_StopMotionDetection Error!");
  UpdateUI(MOTION_STOP);
}

#include "dialog_fixture.h"

namespace {

using Panels = DialogTest;

// Texts an operator may type where a number belongs, and the number they count as.
constexpr struct {
  const char *text;
  int value;
} kTyped[] = {{"", 0},           {"text", 0},        {"   ", 0},
              {"-", 0},          {"-1", -1},         {" 5 ", 5},
              {"2147483648", 0}, {"99999999999", 0}, {"-2147483648", -2147483647 - 1}};

TEST_F(Panels, WhatIsTypedReachesTheSdkOrIsRefused) {
  dialog->comboMotionArea->setCurrentIndex(4);
  dialog->checkMotionArea->setChecked(true);
  const auto error = [](bool refused, const std::string &call) {
    return refused ? "ERROR:zv_" + call + " Error!\n" : "";
  };
  QLineEdit *const edits[] = {dialog->edtLeft,  dialog->edtRight,      dialog->edtTop,  dialog->edtBottom,
                              dialog->edtMLeft, dialog->edtMRight,     dialog->edtMTop, dialog->edtMBottom,
                              dialog->edtFocus, dialog->edtSensitivity};
  for (const auto &[text, value] : kTyped) {
    SCOPED_TRACE(text);
    for (QLineEdit *edit : edits) edit->setText(text);
    const std::string number = std::to_string(value) + "\n", edge = number + "channel 4 : ";
    const int channel = static_cast<int>(static_cast<unsigned>(value) - 1u);
    std::string area = "Mark : 1\nchannel 4 : Left= ";
    area.append(edge)
        .append("Right= ")
        .append(edge)
        .append("Top= ")
        .append(edge)
        .append("Bottom= ")
        .append(number);
    const std::pair<QPushButton *, std::string> rows[] = {
        {dialog->btnSetSensitivity,
         "Channel 0 :Set Sensitivity = " + number + error(value < 0, "SetMotionSensitivity")},
        {dialog->btnSetFocus, "Set Focus channel = " + std::to_string(channel) + "\n" +
                                  error(channel < 0 || channel > 15, "SetFocusChannel")},
        {dialog->btnSetShield, error(value < 0, "SetShieldRect")},
        {dialog->btnSetMotionArea, area + error(value < 0, "MarkMotionArea")}};
    for (const auto &[button, printed] : rows)
      EXPECT_EQ(printed_by([press = button] { press->click(); }), printed);
    for (const QLineEdit *edit : edits) EXPECT_EQ(edit->text(), text);
  }
}

TEST_F(Panels, RecordSettingsOutOfRangeBecomeTen) {
  const struct {
    const char *text;
    int limit, seconds;
  } rows[] = {{"", 10, 10},   {"0", 10, 10},  {"-1", 10, 10},   {"x", 10, 10},   {" 1", 10, 1},  {"9", 10, 9},
              {"59", 59, 59}, {"60", 60, 10}, {"100", 100, 10}, {"101", 10, 10}, {"1.5", 10, 10}};
  for (const auto &[text, limit, seconds] : rows) {
    for (QLineEdit *edit : {dialog->edtDiskLimit, dialog->edtTime}) edit->setText(text);
    dialog->btnFolder->click();
    EXPECT_EQ(std::pair(g_min_diskspace, g_time_interval), std::pair(limit, seconds * 1000)) << text;
    EXPECT_EQ(dialog->edtDiskLimit->text(), limit == 10 ? "10" : text);
    EXPECT_EQ(dialog->edtTime->text(), seconds == 10 ? "10" : text);
  }
}

TEST_F(Panels, SettingsComeBackFromTheCard) {
  dialog->comboShield->setCurrentIndex(3);
  QLineEdit *const edits[] = {dialog->edtLeft,   dialog->edtRight,     dialog->edtTop,
                              dialog->edtBottom, dialog->edtFocus,     dialog->edtSensitivity,
                              dialog->edtHue,    dialog->edtSaturation};
  const char *const typed[] = {"80", "240", "40", "160", "5", "768", "90", "7"};
  for (int n = 0; n < 8; ++n) edits[n]->setText(typed[n]);
  for (auto *set : {dialog->btnSetShield, dialog->btnSetFocus, dialog->btnSetSensitivity}) set->click();
  EXPECT_EQ(printed_by([&] { dialog->btnSetProperty->click(); }),
            "Hue = 90\nSaturation = 7\nContrast = 100\nBrightness = 0\n");
  for (QLineEdit *edit : edits) edit->clear();
  for (auto *get : {dialog->btnGetShield, dialog->btiGetFocus, dialog->btnGetProperty}) get->click();
  EXPECT_EQ(printed_by([&] { dialog->btnGetSensitivity->click(); }), "Channel 0 :Get Sensitivity = 768\n");
  for (int n = 0; n < 8; ++n) EXPECT_EQ(edits[n]->text(), typed[n]);
  EXPECT_EQ(dialog->sliderHue->value(), 90);

  // A failed read: only the mask shows its fill value, and the picture sliders go to 0.
  for (QComboBox *none : {dialog->comboShield, dialog->comboProperty, dialog->comboMotion}) {
    none->setCurrentIndex(-1);
  }
  EXPECT_EQ(printed_by([&] {
              for (auto *get : {dialog->btnGetShield, dialog->btnGetProperty, dialog->btnGetSensitivity}) {
                get->click();
              }
            }),
            "ERROR:zv_GetShieldRect Error!\nERROR:zv_GetVideoProperty Error!\n"
            "ERROR:zv_GetMotionSensitivity Error!\n");
  EXPECT_EQ(dialog->edtBottom->text(), "151587081");
  EXPECT_EQ(dialog->edtSensitivity->text(), "768");
  EXPECT_EQ(dialog->sliderHue->value(), 0);
}

TEST_F(Panels, SlidersAndEditsFollowEachOther) {
  dialog->edtHue->setText("500");
  EXPECT_EQ(dialog->edtHue->text(), "180");
  dialog->edtHue->setText("500");  // the slider stands at its end already
  EXPECT_EQ(
      printed_by([&] { dialog->btnSetProperty->click(); }),
      "Hue = 500\nSaturation = 100\nContrast = 100\nBrightness = 0\nERROR:zv_SetVideoProperty Error!\n");
  dialog->edtHue->setText("0");
  dialog->edtBrightness->setText("-");
  dialog->sliderSaturation->setValue(50);
  EXPECT_EQ(dialog->edtSaturation->text(), "50");
  EXPECT_EQ(dialog->edtBrightness->text(), "0");
}

}  // namespace

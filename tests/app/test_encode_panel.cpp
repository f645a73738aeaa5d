#include "dialog_fixture.h"
#include "zv_lib.h"

namespace {

using EncodePanel = DialogTest;
enum { kNone, kCif, kHalfD1, kD1 };

TEST_F(EncodePanel, QualityAndFieldModeDecideTheChannels) {
  const struct {
    int quality, fields;
    unsigned record;
    int valid;
    u32 scale, twofield;
  } rows[] = {{kCif, 0, 0xFFFF, 16, 2, 0},   {kCif, 1, 0x00FF, 8, 2, 1}, {kHalfD1, 0, 0x00FF, 8, 1, 0},
              {kHalfD1, 1, 0x000F, 4, 1, 1}, {kD1, 1, 0x000F, 4, 3, 0},  {kNone, 1, 0, 0, 3, 0}};
  for (const auto &row : rows) {
    SCOPED_TRACE(testing::Message() << row.quality << " " << row.fields);
    dialog->combowTwoField->setCurrentIndex(row.fields);
    choose(dialog->comboQualityMode, row.quality);
    const bool on = row.quality != kNone;
    EXPECT_EQ(g_record_ch, row.record);
    EXPECT_EQ(g_valid_record_ch, row.valid);
    EXPECT_EQ(dialog->CheckCheckBox(), row.record);
    EXPECT_EQ(zv_config.scale, row.scale);
    EXPECT_EQ(zv_config.twofield, row.twofield);
    EXPECT_EQ(dialog->combowTwoField->isEnabled(), row.quality != kD1);
    EXPECT_EQ(dialog->combowTwoField->currentIndex(), row.quality == kD1 ? 0 : row.fields);
    EXPECT_EQ(dialog->btnRecordStart->isEnabled(), on);
    EXPECT_EQ(dialog->radioEnRecord->isChecked(), on);
    EXPECT_EQ(g_channel_mode, on ? ENABLE_RECORD : INITIAL_CASE);
  }
}

// Choosing a quantiser or a bit rate puts the other back.
TEST_F(EncodePanel, ItemsStandForTheirValues) {
  for (int n = 1; n < dialog->comboCBRValue->count(); ++n) {
    choose(dialog->comboQPvalue, 3);
    choose(dialog->comboCBRValue, n);
    QString text = dialog->comboCBRValue->itemText(n);
    const int unit = text.endsWith('k') ? 1024 : 1048576;
    text.chop(1);
    EXPECT_EQ(zv_config.CBRValue, text.toInt() * unit);
    EXPECT_EQ(zv_config.CBREnable, 1u);
    EXPECT_EQ(zv_config.qp, 4u);
    EXPECT_EQ(dialog->comboQPvalue->currentIndex(), 0);
  }
  for (int n = 1; n < dialog->comboQPvalue->count(); ++n) {
    choose(dialog->comboQPvalue, n);
    EXPECT_EQ(zv_config.qp, dialog->comboQPvalue->itemText(n).toUInt());
    EXPECT_EQ(zv_config.CBREnable, 0u);
    EXPECT_EQ(dialog->comboCBRValue->currentIndex(), 0);
  }
  for (int n = 0; n < dialog->comboGOPValue->count(); ++n) {
    dialog->comboGOPValue->setCurrentIndex(n);
    dialog->SetGOP();
    EXPECT_EQ(zv_config.gop, n ? dialog->comboGOPValue->itemText(n).toUInt() : 30u);
  }
  choose(dialog->comboJpegQuality, 1);
  choose(dialog->comboFrameRate, 15);
  for (QComboBox *none : {dialog->comboJpegQuality, dialog->comboFrameRate}) choose(none, -1);
  EXPECT_EQ(zv_config.jpeg_qp, JPEG_QP_ZV_HIGH);
  EXPECT_EQ(zv_config.interval, INTERVAL_ZV_1FPS_NTSC);
}

TEST_F(EncodePanel, QuantiserRangeFollowsWhatIsTyped) {
  const struct {
    const char *max, *min;
    u32 enable, stored_max, stored_min;
  } rows[] = {{"40", "10", 1, 40, 10}, {"59", "58", 1, 59, 58}, {"40", "", 1, 40, 2},   {"1", "x", 1, 1, 2},
              {"10", "10", 0, 15, 2},  {"60", "1", 0, 15, 2},   {"40", "-1", 0, 15, 2}, {"", "1", 1, 15, 1},
              {"0", "14", 1, 15, 14},  {"", "15", 0, 15, 2},    {"-1", "3", 0, 15, 2},  {"", "", 0, 15, 2}};
  for (const auto &row : rows) {
    dialog->edtQPMax->setText(row.max);
    dialog->edtQPMin->setText(row.min);
    EXPECT_EQ(printed_by([&] { dialog->btnSetQPMinMax->click(); }), "");
    const u32 stored[] = {zv_config.QPMinMaxEnable, zv_config.QPMax, zv_config.QPMin};
    EXPECT_THAT(stored, testing::ElementsAre(row.enable, row.stored_max, row.stored_min))
        << row.max << row.min;
  }
}

TEST_F(EncodePanel, SettingsAreHandedOverAndShownAsReadBack) {
  EXPECT_EQ(dialog->WriteVideoRecordConfig(), 0);  // no channel
  choose(dialog->comboQualityMode, kHalfD1);
  g_record_ch = 0x6;
  choose(dialog->comboQPvalue, 9);
  choose(dialog->comboFrameRate, 6);
  EXPECT_EQ(printed_by([&] { EXPECT_EQ(dialog->WriteVideoRecordConfig(), 1); }), "");
  EXPECT_EQ(dialog->edtScale->text(), "Half D1");
  EXPECT_EQ(dialog->edtFrameRate->text(), "30");
  EXPECT_EQ(dialog->edtQuallity->text(), "9");
  EXPECT_EQ(dialog->edtBitRate->text(), "6");
  ZV_VIDEO_CONFIG stored{};
  zv_GetVideoEncodeConfig(zv_handle, 3, &stored);  // not recorded: the clean settings
  EXPECT_EQ(stored.scale, SCALE_ZV_NO_ENCODE);
  EXPECT_EQ(stored.interval, INTERVAL_ZV_INVALID);

  // Two fields at half the rate: refused channel by channel, then by the check of the whole card.
  choose(dialog->combowTwoField, 1);
  const std::string channel = "ERROR:zv_SetVideoEncodeConfig Error!\n";
  EXPECT_EQ(printed_by([&] { EXPECT_EQ(dialog->WriteVideoRecordConfig(), 0); }),
            channel + channel + "ERROR:zv_CheckVideoEncodeConfig Error!\n");
}

}  // namespace

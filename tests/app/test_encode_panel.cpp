#include "dialog_fixture.h"
#include "zv_lib.h"

namespace {

using EncodePanel = DialogTest;
enum { kNone, kCif, kHalfD1, kD1 };

TEST_F(EncodePanel, QualityAndFieldModeDecideTheChannels) {
  const struct {
    int quality, fields;
    unsigned record, valid, scale, twofield;
  } rows[] = {{kCif, 0, 0xFFFF, 16, 2, 0},   {kCif, 1, 0x00FF, 8, 2, 1}, {kHalfD1, 0, 0x00FF, 8, 1, 0},
              {kHalfD1, 1, 0x000F, 4, 1, 1}, {kD1, 1, 0x000F, 4, 3, 0},  {kNone, 1, 0, 0, 3, 0}};
  for (const auto &[quality, fields, record, valid, scale, twofield] : rows) {
    SCOPED_TRACE(testing::Message() << quality << " " << fields);
    dialog->combowTwoField->setCurrentIndex(fields);
    choose(dialog->comboQualityMode, quality);
    const unsigned found[] = {g_record_ch, static_cast<unsigned>(g_valid_record_ch), zv_config.scale,
                              zv_config.twofield, dialog->CheckCheckBox()};
    EXPECT_THAT(found, testing::ElementsAre(record, valid, scale, twofield, record));
    EXPECT_EQ(dialog->combowTwoField->isEnabled(), quality != kD1);
    EXPECT_EQ(dialog->combowTwoField->currentIndex(), quality == kD1 ? 0 : fields);
    EXPECT_EQ(dialog->btnRecordStart->isEnabled(), quality != kNone);
    EXPECT_EQ(dialog->radioEnRecord->isChecked(), quality != kNone);
    EXPECT_EQ(g_channel_mode, quality != kNone ? ENABLE_RECORD : INITIAL_CASE);
  }
}

// Choosing a quantiser resets the bit rate, and choosing a bit rate resets the quantiser.
TEST_F(EncodePanel, ItemsStandForTheirValues) {
  const auto stored = [] { return std::tuple(zv_config.qp, zv_config.CBREnable, zv_config.CBRValue); };
  for (int n = 1; n < dialog->comboCBRValue->count(); ++n) {
    choose(dialog->comboCBRValue, n);
    EXPECT_EQ(dialog->comboQPvalue->currentIndex(), 0);
    const std::string rate = dialog->comboCBRValue->itemText(n).toStdString();
    EXPECT_EQ(stored(), std::tuple(4u, 1u, std::stoi(rate) * (rate.back() == 'k' ? 1024 : 1048576)));
    const int item = (n - 1) % 8 * 2 + 1;
    for (const int next : {item, item + 1}) {
      choose(dialog->comboQPvalue, next);
      EXPECT_EQ(stored(), std::tuple(dialog->comboQPvalue->itemText(next).toUInt(), 0u, 0));
    }
    EXPECT_EQ(dialog->comboCBRValue->currentIndex(), 0);
  }
  for (int n = 0; n < dialog->comboGOPValue->count(); ++n) {
    dialog->comboGOPValue->setCurrentIndex(n);
    dialog->SetGOP();
    EXPECT_EQ(zv_config.gop, n ? dialog->comboGOPValue->itemText(n).toUInt() : 30u);
  }
  for (const int index : {1, -1}) choose(dialog->comboJpegQuality, index);
  for (const int index : {15, -1}) choose(dialog->comboFrameRate, index);
  EXPECT_EQ(std::pair(zv_config.jpeg_qp, zv_config.interval),
            std::pair(JPEG_QP_ZV_HIGH, INTERVAL_ZV_1FPS_NTSC));
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
  EXPECT_EQ(dialog->edtScale->text() + " " + dialog->edtFrameRate->text() + " " +
                dialog->edtQuallity->text() + " " + dialog->edtBitRate->text(),
            "Half D1 30 9 6");
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

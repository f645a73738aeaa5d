#include <fcntl.h>

#include "sdk_test.h"

namespace vc = virtual_card;
using testing::ElementsAre;

namespace {

class Opening : public CardTest {
 protected:
  void fail_each(int status, const std::function<void(int)> &arm, int expected_hits);
};

/// A command issued with another code, record or order than the driver matches.
TEST_F(Opening, SendsTheCommandsOfOpenAndCloseInOrder) {
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  vc::set_codec_register(0x260, 0xFFFF1234);
  vc::set_motion_level(15, 0x1234);
  vc::record_log(true);
  ASSERT_EQ(zv_Open(&handle), ZV_OK);
  EXPECT_THAT(
      operations(),
      ElementsAre("open encoder", "open display", "open audio", "open vin", "mmap encoder", "c0046413 0",
                  "mmap display", "c0046413 1", "mmap display", "c0046413 2", "mmap display", "c0046413 3",
                  "mmap display", "c002760b 0 0 0 0 0 0 0 0", "c0037608 0 72 0", "c0037608 0 73 11",
                  "c0037608 0 74 11", "c008640e 260 0", "c008640f 260 1234", "c008640f 268 ffff"));
  EXPECT_EQ(vc::log()[0].flags & O_ACCMODE, O_RDWR);
  EXPECT_EQ(vc::log()[4].size, 0x200000u);
  EXPECT_EQ(vc::log()[6].size, 0x240000u);

  u32 level = 0;
  EXPECT_EQ(zv_GetMotionSensitivity(handle, 15, &level), ZV_OK);
  EXPECT_EQ(level, 0x1234u);
  EXPECT_EQ(card().property[7].saturation, 100);
  EXPECT_EQ(card().property[7].contrast, 100);

  vc::record_log(true);
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  EXPECT_THAT(operations(),
              ElementsAre("00006411", "c008640e 260 0", "c008640f 260 1234", "0000640a", "c008640f 268 ffff",
                          "close encoder", "close display", "close audio", "close vin", "munmap encoder",
                          "munmap display", "munmap display", "munmap display", "munmap display"));
}

/// Runs zv_Open() with the 1st, 2nd, 3rd ... call of a kind failing until none is hit.
void Opening::fail_each(int status, const std::function<void(int)> &arm, int expected_hits) {
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  int hits = 0;
  for (int countdown = 1;; ++countdown) {
    faults.reset();
    vc::clear_fault();
    arm(countdown);
    handle = nullptr;
    int result = -1;
    const std::string output = printed_by([&] { result = zv_Open(&handle); });
    if (vc::fault_hits() == 0 && !faults.struck) {
      EXPECT_EQ(result, ZV_OK);
      break;
    }
    ++hits;
    EXPECT_EQ(result, status) << countdown;
    EXPECT_EQ(output, status == ZV_ERR_NO_MEMORY ? "Zarvo SDK: Open Error! Error Code = 3.\n" : "");
    EXPECT_EQ(handle == nullptr, status != ZV_OK);
    close_leaving_nothing();
    EXPECT_EQ(faults.live_allocations, 0) << countdown;
  }
  EXPECT_EQ(hits, expected_hits);
}

/// A failure half way through opening that leaks, crashes, or leaves the SDK unable to open again.
TEST_F(Opening, EveryFailureIsUndone) {
  const auto inject = [](vc::Operation operation) {
    return [=](int countdown) { vc::inject({.operation = operation, .countdown = countdown}); };
  };
  fail_each(ZV_ERR_OPEN, inject(vc::Operation::open), 4);
  fail_each(ZV_ERR_NO_MEMORY, inject(vc::Operation::mmap), 5);
  fail_each(
      ZV_ERR_NO_MEMORY, [](int countdown) { faults.malloc_countdown = countdown; }, 4);
  fail_each(ZV_OK, inject(vc::Operation::ioctl), 11);  // commands may fail: nothing depends on them
}

/// A failed close that closes a number twice later: it may be somebody else's by then.
TEST_F(Opening, CloseGoesOnAfterAFailure) {
  for (int failing = 1; failing <= 4; ++failing) {
    vc::inject({.operation = vc::Operation::close, .countdown = failing});
    EXPECT_EQ(zv_Close(handle), ZV_ERR_CLOSE);
    HANDLE second = nullptr;
    EXPECT_EQ(zv_Open(&second), ZV_ERR_ALREADY_OPEN);
    const int stranger = open("/dev/null", O_RDONLY);
    EXPECT_EQ(zv_Close(handle), ZV_OK);
    EXPECT_GE(fcntl(stranger, F_GETFD), 0) << failing;
    close(stranger);
    EXPECT_EQ(vc::open_descriptors(), 0) << failing;
    ASSERT_EQ(zv_Open(&handle), ZV_OK);
  }
}

/// A null, dead or foreign handle, or a null record, that is followed.
TEST_F(Opening, BadHandlesAndPointersAreRefused) {
  HANDLE dead = handle, second = nullptr;
  EXPECT_EQ(zv_Open(&second), ZV_ERR_ALREADY_OPEN);
  EXPECT_EQ(second, nullptr);
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  ASSERT_EQ(zv_Close(handle), ZV_OK);
  EXPECT_EQ(zv_Open(nullptr), ZV_ERR_PARAM);
  int foreign = 0;
  u8 *picture = nullptr;
  ASSERT_EQ(zv_Open(&handle), ZV_OK);
  for (HANDLE bad : {HANDLE{nullptr}, HANDLE{&foreign}, dead == handle ? HANDLE{&foreign} : dead}) {
    EXPECT_EQ(zv_Start(bad), ZV_ERR_PARAM);
    EXPECT_EQ(zv_Close(bad), ZV_ERR_PARAM);
    EXPECT_EQ(zv_SetVideoStandard(bad, 0), ZV_ERR_PARAM);
    EXPECT_EQ(zv_GetPreviewScreen(bad, &picture), -1);
    EXPECT_EQ(zv_GetVideoStatus(bad), 0xFFFFu);
    EXPECT_EQ(zv_GetHardwareVersion(bad), 3u);
  }
  EXPECT_EQ(zv_GetPreviewScreen(handle, nullptr), -1);
  EXPECT_EQ(zv_SetVideoEncodeConfig(handle, 0, nullptr), ZV_ERR_PARAM);
  EXPECT_EQ(zv_GetVideoProperty(handle, 0, nullptr), ZV_ERR_PARAM);
  EXPECT_EQ(zv_MarkMotionArea(handle, 0, nullptr, 1), ZV_ERR_PARAM);
  EXPECT_EQ(zv_GetTW2815RegisterValue(handle, 0, 0, nullptr), ZV_ERR_PARAM);
}

/// A picture taken from an index or a result the driver got wrong.
TEST_F(Opening, PreviewScreenBelievesOnlyWhatFits) {
  for (const auto &[index, result] :
       {std::pair(0u, 691200L), {3, 0x240000}, {4, 691200}, {~0u, 10}, {1, 0}, {1, 0x240001}, {2, -1}}) {
    if (kReadsAreWatched && result > 0x240000) continue;
    u8 *picture = nullptr;
    vc::queue_preview(index, result);
    EXPECT_EQ(zv_GetPreviewScreen(handle, &picture), result);
    const bool fits = index < 4 && result > 0 && result <= 0x240000;
    EXPECT_EQ(picture, fits ? zarvo::preview_buf[index] : nullptr) << index;
  }
  EXPECT_EQ(vc::log().front().size, 0x240000u);
}

}  // namespace

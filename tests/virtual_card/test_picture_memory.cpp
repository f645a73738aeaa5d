// The picture side when memory runs out.

#include "failing_new.h"
#include "picture_test.h"

namespace {

class MemoryTest : public PictureTest {
 protected:
  /// Makes everything allocate again, for a larger picture, while one allocation fails. Then composes the
  /// same preview in each run. Returns false when the work needs fewer allocations.
  bool run(long failing) {
    power_up();
    for (card::FrameQueue *queue : {&mpeg4, &mjpeg}) queue->reset_counters();
    encode(0, kHalfD1);
    state.channel[0].encoder.number_overlay = true;
    state.motion_enable = 1;
    state.display.motion_trace = true;
    state.display.layout.zoom.level = 1;
    window(0, {0, 0, 360, 240});
    state.width = card::kNarrowWidth;
    fields(7);
    compose();
    state.width = card::kMaxWidth;
    state.standard = VIDEO_STANDARD_ZV_PAL;
    state.mjpeg_quality = driver::kMjpegCoarse;
    window(0, {0, 0, 500, 576});
    screen.assign(std::size_t{card::kMaxWidth} * card::kMaxLines * 2, 0);
    allocations_left = failing;
    attempt([this] { fields(6); });
    attempt([this] { engine.compose(state, screen); });
    attempt([this] { engine.audio_block(state, 0); });
    const bool failed = allocations_left.exchange(-1) < 0;
    next = 20;  // whichever field failed
    fields(8);
    compose();
    return failed;
  }

 private:
  template <typename Work>
  static void attempt(Work work) {
    try {
      work();
    } catch (const std::bad_alloc &) {
    }
  }
};

// Catches: a size that is stored before the memory that it describes, which is a crash at the next look; an
// encoder that stays unusable after a failed allocation; a lost picture that nobody counts.
TEST_F(MemoryTest, AFailedAllocationLosesAtMostItsPicture) {
  ASSERT_FALSE(run(1'000'000));
  const std::vector<u8> expected = screen;
  const auto made = mpeg4.counters().made;
  for (long failing = 0; run(failing); ++failing) {
    ASSERT_EQ(screen, expected) << failing;
    ASSERT_EQ(mpeg4.counters().made, made) << failing;
    ASSERT_EQ(mjpeg.counters().made, made) << failing;
    ASSERT_LE(mpeg4.counters().lost, 1u) << failing;
    ASSERT_LE(mjpeg.counters().lost, 1u) << failing;
  }
}

}  // namespace

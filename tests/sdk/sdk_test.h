/**
 * @file sdk_test.h
 * The world of the SDK's tests: a card as built, with a clock that stands still, and the SDK open on
 * it; what was sent to the card as readable lines; what came out of the callbacks.
 */
#ifndef SDK_TEST_H
#define SDK_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "support.h"
#include "virtual_card.h"
#include "zv_card.h"
#include "zv_lib.h"

/// A sanitizer looks at as many bytes as a read says it has written, so it cannot bear a lie that is
/// larger than the buffer.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr bool kReadsAreWatched = true;
#else
inline constexpr bool kReadsAreWatched = false;
#endif

using Words = std::vector<std::uint32_t>;
using Lines = std::vector<std::string>;
using Bytes = std::vector<std::uint8_t>;

/// A command as issued() tells it: the code as it must be on the wire, and the record's
/// little-endian words, or its bytes when it is not made of words.
std::string cmd(std::uint32_t code, const Words &words = {});
/// The commands since the last call, without those the data threads repeat all the time.
Lines issued();
/// The same in one line, with "; " between the commands.
std::string sent();
/// Everything done to the device nodes since the log was started.
Lines operations();
std::size_t count(const Lines &lines, const std::string &line);

/// The number of entries, as in /proc/self/fd.
std::size_t entries(const char *directory);

// Faults between the SDK and libc. A fault strikes the `countdown`-th call from now, once.
struct Faults {
  int malloc_countdown = 0;
  int thread_countdown = 0;
  bool struck = false;
  int live_allocations = 0;         ///< since reset()
  std::atomic<int> clock_ahead{0};  ///< seconds on the SDK's monotonic clock
  std::atomic<int> clock_reads{0};
  void reset() { malloc_countdown = thread_countdown = live_allocations = 0, struck = false; }
};
extern Faults faults;

/// A frame or block that a callback got: "stream channel offset length flags", where the stream is m, j
/// or a, the offset is that in the stream's area, and the flags are hexadecimal; and the data.
struct Delivery {
  std::string summary;
  Bytes data;
};
/// The callbacks, and what they got. `on_delivery` runs inside the callback.
std::vector<Delivery> deliveries();
Lines summaries();
bool wait_for_deliveries(std::size_t number);
extern std::function<void(const Delivery &)> on_delivery;
void keep(char stream, const u8 *area, u32 channel, const u8 *data, i32 length, i32 flags);
template <char kStream>
void callback(u32 channel, u8 *data, i32 length, i32 flags) {
  u8 *const area = kStream == 'm' ? zarvo::mpeg4_buf : kStream == 'j' ? zarvo::mjpeg_buf : zarvo::audio_buf;
  keep(kStream, area, channel, data, length, flags);
}

class CardTest : public testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;
  void open_card();
  void close_leaving_nothing();
  /// Stores settings for the channels of `mask`, enables them, and forgets the log.
  void enable(u32 mask, ZV_SCALE_VALUE scale = SCALE_ZV_CIF);
  zarvo::ZV_CARD &card() { return *zarvo::card_of(handle); }

  HANDLE handle = nullptr;
  std::size_t descriptors_before = 0;
};

#endif

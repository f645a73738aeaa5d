/**
 * @file sdk_test.h
 * The world of the SDK's tests: a card as built, whose time stands still, and the SDK open on it.
 */
#ifndef SDK_TEST_H
#define SDK_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <functional>

#include "support.h"
#include "virtual_card.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace card = virtual_card;
namespace driver = zarvo::driver;
using testing::ElementsAre;

/// A sanitizer looks at as many bytes as a read says it has written: a lie must not exceed the buffer.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr bool kReadsAreWatched = true;
#else
inline constexpr bool kReadsAreWatched = false;
#endif

using Lines = std::vector<std::string>;
using Bytes = std::vector<u8>;

/// The name of a command with the words of its record.
template <typename... Words>
std::string line(std::string name, Words... words) {
  ((name += ' ' + std::to_string(words)), ...);
  return name;
}
/// The name of a command by its number, from a table that is independent of the driver's header. That of a
/// register access is in small letters.
std::string command_name(u32 code);
/// Everything done to the device nodes since the log was started: "VIN_IOC_SET_WIDTH 704", a register access
/// as "read 0x310" or "decoder write 1 0x17 84" in hexadecimal, another call as "mmap display 0x240000".
Lines operations();
/// The commands since the last call, without those that the video thread repeats all the time.
Lines issued();
/// The same in one line, with "; " between the commands; for a call with this status, which must be ZV_OK.
std::string sent(int status = ZV_OK);
std::size_t count(const Lines &lines, const std::string &line);

/// Faults between the SDK and libc, and what the SDK has of it. A fault strikes the `countdown`-th call from
/// now, once.
struct Faults {
  int malloc_countdown = 0;
  int thread_countdown = 0;
  std::atomic<int> threads{0};    ///< created, not joined
  std::atomic<long> clock_ms{0};  ///< the SDK's monotonic clock, which stands still
  std::atomic<int> clock_reads{0};
};
extern Faults faults;

/// What the callbacks got, a line each: "stream channel offset length flags", where the stream is m, j or a,
/// the offset is that in the stream's area, and the flags are hexadecimal.
Lines delivered();
/// The first 8 KiB that came with the last such line.
Bytes data_of(const std::string &line);
/// Runs inside the callback.
extern std::function<void(const std::string &line)> on_delivery;
void keep(char stream, u32 channel, const u8 *data, i32 length, i32 flags);
template <char kStream>
void callback(u32 channel, u8 *data, i32 length, i32 flags) {
  keep(kStream, channel, data, length, flags);
}

/// Encoder settings with GOP 25 and quantiser 6.
ZV_VIDEO_CONFIG settings(ZV_SCALE_VALUE scale, u32 interval = 0, ZV_TWOFIELD_MODE two = TWOFIELD_DISABLE);

/// Calls that all have the same result; the order in which they are made is not defined.
template <typename... Results>
void expect_all(int expected, Results... results) {
  EXPECT_THAT((std::array{results...}), testing::Each(expected));
}

class SdkTest : public testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;
  void open_card();
  void close_leaving_nothing();
  /// Stores CIF settings for the channels of `mask`, enables them, and forgets the log.
  void enable(u32 mask);
  /// What the SDK keeps of the card.
  zarvo::ZV_CARD &kept() { return *zarvo::card_of(handle); }

  HANDLE handle = nullptr;
};

#endif

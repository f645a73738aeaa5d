#include <climits>
#include <random>

#include "sdk_test.h"

namespace vc = virtual_card;

namespace {

constexpr std::ptrdiff_t kArea = 0x100000;
constexpr long kHuge = kReadsAreWatched ? 0x100001 : LONG_MAX;
constexpr long kLarge = kReadsAreWatched ? 0x100002 : INT_MAX;

/// Frames as a broken card may send them; the callbacks check each delivery against its area.
class Malformed : public CardTest {
 protected:
  void SetUp() override {
    CardTest::SetUp();
    enable(0xFFFF);
    // The data itself is not kept: what counts is whether it is inside.
    ASSERT_EQ(zv_RegisterCallBack(handle, mpeg4, mjpeg, nullptr), ZV_OK);
    outside = delivered = 0;
    last_seen = 0;
  }

  /// Captures until the marker frames queued last have come out of both streams.
  void capture() {
    Bytes marker(7, 0x33);
    vc::queue_mpeg4(vc::mpeg4_frame(0, 1, marker));
    marker.insert(marker.end(), {0xFF, 0xD9});
    vc::queue_mjpeg(vc::mjpeg_frame(0, 1, 1, marker));
    ASSERT_EQ(zv_Start(handle), ZV_OK);
    EXPECT_TRUE(eventually([] { return last_seen == 2; }));
    EXPECT_EQ(zv_Stop(handle), ZV_OK);
    EXPECT_EQ(outside, 0);
  }

  static void check(const u8 *area, u32 channel, const u8 *data, i32 length, std::ptrdiff_t room,
                    i32 marker) {
    const std::ptrdiff_t offset = data - area;
    if (channel > 15 || length < 0 || offset < 44 || offset + length > room) ++outside;
    ++delivered;
    if (length == marker) ++last_seen;
  }
  static void mpeg4(u32 channel, u8 *data, i32 length, i32) {
    check(zarvo::mpeg4_buf, channel, data, length, kArea, 7);
  }
  static void mjpeg(u32 channel, u8 *data, i32 length, i32) {
    check(zarvo::mjpeg_buf, channel, data, length, kArea, 593 + 9);
    if (data[0] != 0xFF || data[length - 1] != 0xD9) ++outside;
  }

  static inline std::atomic<int> outside, delivered, last_seen;
};

Bytes mjpeg_area(std::uint32_t channel, const Bytes &scan) {
  Bytes area(16 + scan.size());
  for (std::size_t i = 0; i < 4; ++i) area[i] = static_cast<std::uint8_t>(channel >> 8 * i);
  std::copy(scan.begin(), scan.end(), area.begin() + 16);
  return area;
}

/// Lengths, results and channels at and just beyond each limit.
TEST_F(Malformed, LimitsOfEveryField) {
  struct Length {
    std::uint32_t length;
    int delivered;
  };
  int expected = 2;  // the markers
  for (const Length &test : {Length{0, 1}, Length{0xFFFC0, 1}, Length{0xFFFC1, 0}, Length{0xFFFFF, 0}})
    for (std::uint32_t type : {0x00, 0x40, 0xC0}) {
      Bytes area(64, 0);
      area[0] = static_cast<std::uint8_t>(test.length);
      area[1] = static_cast<std::uint8_t>(test.length >> 8);
      area[2] = static_cast<std::uint8_t>(test.length >> 16 | type | 0x30u);  // the unused bits are set
      area[3] = 0xF5;
      vc::queue_mpeg4({area, 1});
      vc::queue_mpeg4({area, 0});
      vc::queue_mpeg4({area, LONG_MIN});
      expected += test.delivered;
    }
  const Bytes scan = {1, 2, 3, 0xFF, 0xD9};
  struct Jpeg {
    std::uint32_t channel;
    Bytes scan;
    long result;
    int delivered;
  };
  for (const Jpeg &test :
       {Jpeg{15, scan, 21, 1}, Jpeg{16, scan, 21, 0}, Jpeg{0xFFFFFFFF, scan, 21, 0}, Jpeg{1, scan, 16, 0},
        Jpeg{1, scan, 19, 0}, Jpeg{1, {0xD9}, 17, 1}, Jpeg{1, scan, 0xFFC00, 1}, Jpeg{1, scan, 0xFFC01, 0},
        Jpeg{1, scan, kHuge, 0}, Jpeg{1, scan, -7, 0}, Jpeg{1, {0xFF, 0, 0xFF}, 19, 0}}) {
    vc::queue_mjpeg({mjpeg_area(test.channel, test.scan), test.result});
    expected += test.delivered;
  }
  capture();
  EXPECT_EQ(delivered, expected);
}

/// Any bytes at all.
TEST_F(Malformed, AnyBytes) {
  std::mt19937 random(20240229);
  const auto any_byte = [&] { return static_cast<std::uint8_t>(random()); };
  const long results[] = {1, 16, 17, 64, 700, 0xFFBFF, 0xFFC00, 0x100000, kLarge, INT_MIN, -1};
  for (int i = 0; i < 400; ++i) {
    Bytes area(64 + random() % 64);
    for (std::uint8_t &byte : area) byte = any_byte();
    if (area.size() > 8 && i % 2 == 0) area[1] = area[2] = area[3] = 0;  // half of them with a fair channel
    const long result = results[random() % std::size(results)];
    vc::queue_mpeg4({area, result});
    vc::queue_mjpeg({area, result});
  }
  capture();
  EXPECT_GT(delivered, 20);
}

}  // namespace

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

Bytes bytes_of(std::uint32_t word) {
  const auto *bytes = reinterpret_cast<const u8 *>(&word);
  return Bytes(bytes, bytes + sizeof word);
}

/// Lengths, results and channels at and just beyond each limit.
TEST_F(Malformed, LimitsOfEveryField) {
  int expected = 2;  // the markers
  for (const std::uint32_t length : {0u, 0xFFFC0u, 0xFFFC1u, 0xFFFFFu})
    for (std::uint32_t type : {0x00, 0x40, 0xC0}) {
      Bytes area = bytes_of(length | type << 16 | 0xF5300000);  // the unused bits are set
      area.resize(64);
      for (const long result : {1L, 0L, LONG_MIN}) vc::queue_mpeg4({area, result});
      expected += length <= 0xFFFC0;
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
    Bytes area = bytes_of(test.channel);
    area.resize(16);
    area.insert(area.end(), test.scan.begin(), test.scan.end());
    vc::queue_mjpeg({area, test.result});
    expected += test.delivered;
  }
  capture();
  EXPECT_EQ(delivered, expected);
}

/// Any bytes at all.
TEST_F(Malformed, AnyBytes) {
  std::mt19937 random(20240229);
  const long results[] = {1, 16, 17, 64, 700, 0xFFBFF, 0xFFC00, 0x100000, kLarge, INT_MIN, -1};
  for (int i = 0; i < 400; ++i) {
    Bytes area(64 + random() % 64);
    for (std::uint8_t &byte : area) byte = static_cast<std::uint8_t>(random());
    if (area.size() > 8 && i % 2 == 0) area[1] = area[2] = area[3] = 0;  // half of them with a fair channel
    const long result = results[random() % std::size(results)];
    vc::queue_mpeg4({area, result});
    vc::queue_mjpeg({area, result});
  }
  capture();
  EXPECT_GT(delivered, 20);
}

}  // namespace

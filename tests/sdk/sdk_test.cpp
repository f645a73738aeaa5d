// The world of the SDK's tests: the log as lines, faults between the SDK and libc, and the callbacks.

#include "sdk_test.h"

#include <malloc.h>
#include <pthread.h>
#include <time.h>

#include <cstring>
#include <mutex>

namespace {

std::string hex(u32 word) {
  char text[16];
  std::snprintf(text, sizeof text, "%x", word);
  return text;
}

/// Instead of its pointer, a motion map shows the number of thresholds, and their value if all are the same.
std::string thresholds(const Bytes &record) {
  const u8 *first = record.data() + 16 + 2 * sizeof(void *), *end = record.data() + record.size();
  return ": " + std::to_string((end - first) / 2) + " x " +
         (std::equal(first + 2, end, first) ? std::to_string(first[0] | first[1] << 8) : "various");
}

std::string command_line(u32 code, const Bytes &record) {
  std::string text = command_name(code);
  const bool map = text == "VIN_IOC_SET_MOTION_MAP";
  const std::size_t size = record.size() == 3 ? 1 : 4;  // the record of a decoder's register has bytes
  std::vector<u32> words(map ? 5 : record.size() / size);
  for (std::size_t n = 0; n < words.size(); ++n) std::memcpy(&words[n], &record[n * size], size);
  if (std::islower(text[0]) && words.size() > 1) {
    if (size == 1) text = line(text, words[0]);
    const u32 *access = &words[words.size() - 2];
    return text + " 0x" + hex(access[0]) + (text.find("write") < text.size() ? ' ' + hex(access[1]) : "");
  }
  for (const u32 word : words) text = line(text, word);
  return map ? text + thresholds(record) : text;
}

std::string describe(const card::Call &call) {
  static const char *const kDevices[] = {"encoder", "display", "audio", "vin"};
  static const char *const kOperations[] = {"open ", "close ", "", "read ", "mmap ", "munmap "};
  if (call.operation == card::Operation::ioctl) return command_line(call.code, call.argument);
  return std::string(kOperations[static_cast<int>(call.operation)]) +
         kDevices[static_cast<int>(call.device)] +
         (call.size > 0 ? " 0x" + hex(static_cast<u32>(call.size)) : "");
}

std::mutex delivery_mutex;
std::vector<std::pair<std::string, Bytes>> deliveries;

bool strikes(int &countdown) {
  return countdown > 0 && --countdown == 0;
}

}  // namespace

Lines operations() {
  Lines lines;
  for (const card::Call &call : card::log()) lines.push_back(describe(call));
  return lines;
}

Lines issued() {
  Lines lines = operations();
  card::record_log(true);
  std::erase_if(lines, [](const std::string &line) {
    return line.starts_with("ENC_IOC_MPEG4_") || line.starts_with("read encoder");
  });
  return lines;
}

std::string sent(int status) {
  EXPECT_EQ(status, ZV_OK);
  std::string text;
  for (const std::string &line : issued()) text += (text.empty() ? "" : "; ") + line;
  return text;
}

std::size_t count(const Lines &lines, const std::string &line) {
  return static_cast<std::size_t>(std::count(lines.begin(), lines.end(), line));
}

Faults faults;

extern "C" {
void *__real_malloc(std::size_t size);
void *__real_memalign(std::size_t alignment, std::size_t size);
int __real_pthread_create(pthread_t *, const pthread_attr_t *, void *(*)(void *), void *);
int __real_pthread_join(pthread_t, void **);

void *__wrap_malloc(std::size_t size) {
  return strikes(faults.malloc_countdown) ? nullptr : __real_malloc(size);
}
void *__wrap_memalign(std::size_t alignment, std::size_t size) {
  return strikes(faults.malloc_countdown) ? nullptr : __real_memalign(alignment, size);
}
int __wrap_pthread_create(pthread_t *thread, const pthread_attr_t *attributes, void *(*routine)(void *),
                          void *argument) {
  if (strikes(faults.thread_countdown)) return EAGAIN;
  ++faults.threads;
  return __real_pthread_create(thread, attributes, routine, argument);
}
int __wrap_pthread_join(pthread_t thread, void **result) {
  --faults.threads;
  return __real_pthread_join(thread, result);
}
int __wrap_clock_gettime(clockid_t, timespec *now) {
  const long ms = faults.clock_ms;
  *now = {ms / 1000, ms % 1000 * 1000000};
  ++faults.clock_reads;
  return 0;
}
}

std::function<void(const std::string &)> on_delivery;

void keep(char stream, u32 channel, const u8 *data, i32 length, i32 flags) {
  const u8 *area = stream == 'm' ? zarvo::mpeg4_buf : stream == 'j' ? zarvo::mjpeg_buf : zarvo::audio_buf;
  EXPECT_TRUE(channel < ZV_CHANNELS && length >= 0 && data >= area && data + length <= area + 0x100000);
  const std::string got = line({stream}, channel, data - area, length) + ' ' + hex(u32(flags));
  if (on_delivery) on_delivery(got);
  const std::lock_guard lock(delivery_mutex);
  deliveries.emplace_back(got, Bytes(data, data + std::min(length, 8192)));
}

Lines delivered() {
  const std::lock_guard lock(delivery_mutex);
  Lines lines;
  for (const auto &[line, data] : deliveries) lines.push_back(line);
  return lines;
}

Bytes data_of(const std::string &line) {
  const std::lock_guard lock(delivery_mutex);
  const auto got = std::find_if(deliveries.rbegin(), deliveries.rend(),
                                [&](const auto &delivery) { return delivery.first == line; });
  return got != deliveries.rend() ? got->second : Bytes();
}

ZV_VIDEO_CONFIG settings(ZV_SCALE_VALUE scale, u32 interval, ZV_TWOFIELD_MODE two) {
  ZV_VIDEO_CONFIG config{};
  config.scale = scale;
  config.interval = static_cast<ZV_INTERVAL_VALUE>(interval);
  config.twofield = two;
  config.gop = 25;
  config.qp = 6;
  return config;
}

void SdkTest::SetUp() {
  card::reset();
  card::set_clock(card::ClockMode::manual);
  faults.malloc_countdown = faults.thread_countdown = faults.threads = 0;
  on_delivery = nullptr;
  deliveries.clear();
  open_card();
  card::record_log(true);
}

void SdkTest::open_card() {
  ASSERT_EQ(zv_Open(&handle), ZV_OK);
  ASSERT_EQ(zv_RegisterCallBack(handle, callback<'m'>, callback<'j'>, callback<'a'>), ZV_OK);
}

void SdkTest::close_leaving_nothing() {
  EXPECT_EQ(zv_Close(handle), ZV_OK);
  EXPECT_EQ(card::open_descriptors(), 0);
  EXPECT_EQ(card::open_mappings(), 0);
  EXPECT_EQ(faults.threads, 0);
}

void SdkTest::TearDown() {
  card::apply("fail=");
  EXPECT_EQ(zv_Stop(handle), ZV_OK);
  close_leaving_nothing();
}

void SdkTest::enable(u32 mask) {
  const ZV_VIDEO_CONFIG config = settings(SCALE_ZV_CIF);
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) zv_SetVideoEncodeConfig(handle, channel, &config);
  EXPECT_EQ(zv_EnableVideoRecordChannels(handle, mask), ZV_OK);
  card::record_log(true);
}

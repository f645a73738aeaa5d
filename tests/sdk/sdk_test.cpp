#include "sdk_test.h"

#include <malloc.h>
#include <pthread.h>
#include <time.h>

#include <cerrno>
#include <filesystem>
#include <mutex>

namespace vc = virtual_card;

namespace {

constexpr std::uint32_t kSetMotionMap = 0x40187602;

/// Of a motion map, whose pointer is of no interest: its five words, the number of thresholds, and
/// their value if it is the same for all.
Words words_of(const vc::Call &command) {
  const Bytes &bytes = command.argument;
  const bool map = command.code == kSetMotionMap;
  if (!map && bytes.size() % 4 != 0) return Words(bytes.begin(), bytes.end());
  Words words((map ? 20 : bytes.size()) / 4);
  std::copy_n(bytes.data(), words.size() * 4, reinterpret_cast<u8 *>(words.data()));
  if (!map) return words;
  const std::size_t record = sizeof(void *) == 8 ? 32 : 24;
  const bool same = std::equal(bytes.begin() + record + 2, bytes.end(), bytes.begin() + record);
  words.push_back(static_cast<std::uint32_t>((bytes.size() - record) / 2));
  words.push_back(same ? bytes[record] | std::uint32_t{bytes[record + 1]} << 8 : ~0u);
  return words;
}

std::string describe(const vc::Call &command) {
  static const char *const kDevices[] = {"encoder", "display", "audio", "vin", "none"};
  static const char *const kOperations[] = {"open", "close", "ioctl", "read", "mmap", "munmap"};
  if (command.operation == vc::Operation::ioctl) return cmd(command.code, words_of(command));
  return std::string(kOperations[static_cast<int>(command.operation)]) + " " +
         kDevices[static_cast<int>(command.device)];
}

std::mutex delivery_mutex;
std::vector<Delivery> delivery_list;

bool strikes(int &countdown) {
  if (countdown == 0 || --countdown > 0) return false;
  return faults.struck = true;
}

template <typename... Arguments>
void *allocate(void *(*real)(Arguments...), Arguments... arguments) {
  if (strikes(faults.malloc_countdown)) return nullptr;
  ++faults.live_allocations;
  return real(arguments...);
}

}  // namespace

std::string cmd(std::uint32_t code, const Words &words) {
  char text[32];
  std::snprintf(text, sizeof text, "%08x", code);
  std::string line = text;
  // Register accesses in hexadecimal, sizes and places in decimal.
  static const Words kRegisters = {0xC008640E, 0xC008640F, 0xC0087605, 0xC0087606,
                                   0xC0037607, 0xC0037608, 0xC008760A, 0xC008650E};
  const bool hex = std::find(kRegisters.begin(), kRegisters.end(), code) != kRegisters.end();
  for (std::uint32_t word : words) {
    std::snprintf(text, sizeof text, hex ? " %x" : " %u", word);
    line += text;
  }
  return line;
}

Lines issued() {
  Lines lines;
  for (const vc::Call &command : vc::log())
    if (command.operation == vc::Operation::ioctl && command.code != 0x650F && command.code != 0x6509)
      lines.push_back(describe(command));
  vc::record_log(true);
  return lines;
}

std::string sent() {
  std::string text;
  for (const std::string &line : issued()) text += (text.empty() ? "" : "; ") + line;
  return text;
}

Lines operations() {
  Lines lines;
  for (const vc::Call &command : vc::log()) lines.push_back(describe(command));
  return lines;
}

std::size_t count(const Lines &lines, const std::string &line) {
  return static_cast<std::size_t>(std::count(lines.begin(), lines.end(), line));
}

std::size_t entries(const char *directory) {
  const std::filesystem::directory_iterator list(directory);
  return static_cast<std::size_t>(std::distance(begin(list), end(list)));
}

Faults faults;

extern "C" {
void *__real_malloc(std::size_t size);
void *__real_memalign(std::size_t alignment, std::size_t size);
void __real_free(void *memory);
int __real_pthread_create(pthread_t *, const pthread_attr_t *, void *(*)(void *), void *);
int __real_clock_gettime(clockid_t clock, timespec *now);

void *__wrap_malloc(std::size_t size) {
  return allocate(__real_malloc, size);
}
void *__wrap_memalign(std::size_t alignment, std::size_t size) {
  return allocate(__real_memalign, alignment, size);
}
void __wrap_free(void *memory) {
  if (memory != nullptr) --faults.live_allocations;
  __real_free(memory);
}
int __wrap_pthread_create(pthread_t *thread, const pthread_attr_t *attributes, void *(*routine)(void *),
                          void *argument) {
  return strikes(faults.thread_countdown) ? EAGAIN
                                          : __real_pthread_create(thread, attributes, routine, argument);
}
int __wrap_clock_gettime(clockid_t clock, timespec *now) {
  const int result = __real_clock_gettime(clock, now);
  now->tv_sec += faults.clock_ahead;
  ++faults.clock_reads;
  return result;
}
}

std::function<void(const Delivery &)> on_delivery;

void keep(char stream, const u8 *area, u32 channel, const u8 *data, i32 length, i32 flags) {
  char summary[80];
  std::snprintf(summary, sizeof summary, "%c %u %td %d %x", stream, channel, data - area, length, flags);
  const Delivery delivery{summary, Bytes(data, data + length)};
  if (on_delivery) on_delivery(delivery);
  const std::lock_guard lock(delivery_mutex);
  delivery_list.push_back(delivery);
}

std::vector<Delivery> deliveries() {
  const std::lock_guard lock(delivery_mutex);
  return delivery_list;
}

Lines summaries() {
  Lines lines;
  for (const Delivery &delivery : deliveries()) lines.push_back(delivery.summary);
  return lines;
}

bool wait_for_deliveries(std::size_t number) {
  return eventually([&] { return deliveries().size() >= number; });
}

void CardTest::SetUp() {
  vc::reset();
  vc::set_clock(vc::ClockMode::manual);
  faults.reset();
  on_delivery = nullptr;
  delivery_list.clear();
  descriptors_before = entries("/proc/self/fd");
  open_card();
  vc::record_log(true);
}

void CardTest::open_card() {
  ASSERT_EQ(zv_Open(&handle), ZV_OK);
  ASSERT_EQ(zv_RegisterCallBack(handle, callback<'m'>, callback<'j'>, callback<'a'>), ZV_OK);
}

void CardTest::close_leaving_nothing() {
  EXPECT_EQ(zv_Close(handle), ZV_OK);
  EXPECT_EQ(vc::open_descriptors(), 0);
  EXPECT_EQ(vc::open_mappings(), 0);
  EXPECT_EQ(entries("/proc/self/fd"), descriptors_before);
}

void CardTest::TearDown() {
  vc::clear_fault();
  EXPECT_EQ(zv_Stop(handle), ZV_OK);
  if (zarvo::card_of(handle) != nullptr) {
    EXPECT_EQ(zv_DisableWatchDog(handle), ZV_OK);
  }
  close_leaving_nothing();
}

void CardTest::enable(u32 mask, ZV_SCALE_VALUE scale) {
  ZV_VIDEO_CONFIG config{};
  config.scale = scale;
  config.gop = 30;
  config.qp = 4;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel)
    if ((mask >> channel & 1) != 0) {
      EXPECT_EQ(zv_SetVideoEncodeConfig(handle, channel, &config), ZV_OK);
    }
  EXPECT_EQ(zv_EnableVideoRecordChannels(handle, mask), ZV_OK);
  vc::record_log(true);
}

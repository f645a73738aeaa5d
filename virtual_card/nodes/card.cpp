// Creates the card, passes calls to its nodes, and counts descriptors and mappings.
#include "card.h"

#include <fcntl.h>
#include <sys/mman.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "device_audio.h"
#include "device_display.h"
#include "device_encoder.h"
#include "device_video_input.h"
#include "host/message.h"
#include "host/real_calls.h"
#include "state_file.h"

namespace virtual_card {
namespace {

constinit std::atomic<Card *> current{nullptr};
constinit std::mutex creation_mutex;  // guards the creation of the card
Card *left_to_parent = nullptr;  // the parent's card in a forked child; kept so that leak checkers find it
constinit thread_local bool making = false;  // this thread is creating the card

/// Sets `making` while it exists. Opening a film of the options calls libc's functions, which may lead back
/// to instance().
class Making {
 public:
  Making() { making = true; }
  ~Making() { making = false; }
  Making(const Making &) = delete;
  Making &operator=(const Making &) = delete;
};

/// Returns the path without links, from the root: the host may change its folder before the last close, and
/// then the file behind a link is replaced, not the link.
std::string lasting_path(const std::string &path) {
  std::error_code error;
  const auto absolute = std::filesystem::absolute(path, error);
  const auto resolved = std::filesystem::weakly_canonical(absolute, error);
  return error ? path : resolved.string();
}

/// Ends the card's threads at exit, before the host's libraries are unloaded.
struct AtExit {
  ~AtExit() {
    if (Card *card = current.load()) card->power_off();
  }
};

}  // namespace

Device device_of(const char *path) {
  constexpr std::pair<const char *, Device> kNodes[] = {{driver::kEncoderNode, Device::encoder},
                                                        {driver::kDisplayNode, Device::display},
                                                        {driver::kAudioNode, Device::audio},
                                                        {driver::kVideoInputNode, Device::video_input}};
  for (const auto &[name, device] : kNodes)
    if (std::strcmp(name, path) == 0) return device;
  return Device::none;
}

Card &Card::instance() {
  if (Card *card = current.load(std::memory_order_acquire)) return *card;
  if (making) throw std::system_error(EBUSY, std::generic_category());
  const std::lock_guard lock(creation_mutex);
  if (Card *card = current.load(std::memory_order_acquire)) return *card;
  const Making now;
  static const AtExit at_exit;
  Card *card = new Card;
  current.store(card, std::memory_order_release);
  return *card;
}

void Card::before_fork() {
  creation_mutex.lock();
}

void Card::after_fork(bool child) {
  if (child) left_to_parent = current.exchange(nullptr);
  creation_mutex.unlock();
}

Card::Card() {
  nodes_[0] = std::make_unique<EncoderDevice>(board_);
  nodes_[1] = std::make_unique<DisplayDevice>(board_);
  nodes_[2] = std::make_unique<AudioDevice>(board_);
  nodes_[3] = std::make_unique<VideoInputDevice>(board_);
  power_up();
}

void Card::power_up() {
  const char *text = std::getenv("ZARVO_VIRTUAL_CARD");
  PowerUp power_up;
  std::string &error = board_.power_up_error;
  error = board_.apply(text == nullptr ? "" : text, &power_up);
  if (power_up.speed != 1.0) board_.clock.power_up(ClockMode::fast, power_up.speed);
  std::string reason;
  if (!power_up.log_file.empty() && error.empty() && !board_.log.write_to(power_up.log_file, reason))
    error = "item \"log\": cannot write " + power_up.log_file + ": " + reason;
  if (!power_up.state_file.empty() && error.empty()) {
    state_file_ = lasting_path(power_up.state_file);
    reason = load_state(state_file_, nodes_);
    if (!reason.empty()) error = "item \"state\": " + state_file_ + ": " + reason;
  }
  // A forked child does not open the control socket: the parent uses it.
  if (!power_up.control_socket.empty() && error.empty() && left_to_parent == nullptr)
    error = control_.start(power_up.control_socket);
  if (!error.empty()) print_message("ZARVO_VIRTUAL_CARD: %s", error.c_str());
}

DeviceNode *Card::node(Device device) {
  const auto index = static_cast<std::size_t>(device);
  return index < nodes_.size() ? nodes_[index].get() : nullptr;
}

void Card::log(Call call, long result) {
  board_.log.add(std::move(call), result, board_.clock.now());
}

void Card::stop() {
  runner_.stop();
  board_.last_close();
  for (const auto &each : nodes_) each->region().release();
}

void Card::last_close() {
  stop();
  if (!state_file_.empty()) {
    const std::string reason = save_state(state_file_, board_);
    if (!reason.empty()) print_message("%s keeps an older state: %s", state_file_.c_str(), reason.c_str());
  }
  const unsigned long long frames = board_.mpeg4.queue.take_unread() + board_.mjpeg.queue.take_unread();
  const unsigned long long blocks = board_.audio.queue.take_unread();
  if (frames + blocks > 0)
    print_message(
        "%llu video frames and %llu blocks of each audio input are lost: the program did not read them in "
        "time",
        frames, blocks);
}

long Card::open(Device device, int flags, int sibling) {
  Call call{Operation::open, device};
  call.flags = flags;
  const long result = [&]() -> long {
    if (const int error = board_.call_faults.strike(Operation::open, device)) return -error;
    if (!board_.power_up_error.empty()) return -EINVAL;
    board_.refresh(board_.clock.now());
    if (device == Device::none || board_.absent) return -ENOENT;
    if (board_.vanished) return -ENODEV;
    const std::lock_guard lock(power_mutex_);
    if (open_ == 0 && !off_)
      if (const long error = runner_.start()) return error;
    const long fd = node(device)->region().open(sibling, (flags & O_CLOEXEC) != 0);
    if (fd >= 0) ++open_;
    if (open_ == 0) stop();
    return fd;
  }();
  log(std::move(call), result);
  return result;
}

long Card::close(Device device) {
  const long result = -board_.call_faults.strike(Operation::close, device);
  log({Operation::close, device}, result);
  return result;
}

long Card::ioctl(Device device, u32 code, std::uintptr_t argument) {
  DeviceNode *target = node(device);
  return target == nullptr ? -ENODEV : target->ioctl(code, argument);
}

long Card::read(Device device, std::uintptr_t buffer, std::size_t count) {
  DeviceNode *target = node(device);
  if (target == nullptr) return -ENODEV;
  long result = -board_.call_faults.strike(Operation::read, device);
  if (result == 0)
    result = board_.vanished.load(std::memory_order_relaxed) ? -ENODEV : target->read(buffer, count);
  if (board_.log.on()) {
    Call call{Operation::read, device};
    call.value = buffer;
    call.size = count;
    log(std::move(call), result);
  }
  return result;
}

long Card::mmap(Device device, int fd, const MapRequest &request, void *&mapped) {
  DeviceNode *target = node(device);
  if (target == nullptr) return -ENODEV;
  Call call{Operation::mmap, device};
  call.size = request.length;
  call.protection = request.protection;
  call.flags = request.flags;
  const long result = [&]() -> long {
    if (const int error = board_.call_faults.strike(Operation::mmap, device)) return -error;
    if ((request.flags & MAP_SHARED) == 0) return -EINVAL;
    const long place = target->place_mapping(request.length, request.protection, request.offset);
    if (place < 0) return place;
    const std::lock_guard lock(power_mutex_);
    mapped = real::mmap(real::Name::mmap, request.address, request.length, request.protection, request.flags,
                        fd, place);
    if (mapped == MAP_FAILED) return -errno;
    ++mapped_;
    return 0;
  }();
  log(std::move(call), result);
  return result;
}

long Card::munmap(Device device, std::size_t length) {
  Call call{Operation::munmap, device};
  call.size = length;
  const long result = -board_.call_faults.strike(Operation::munmap, device);
  log(std::move(call), result);
  return result;
}

void Card::duplicated() {
  const std::lock_guard lock(power_mutex_);
  ++open_;
}

void Card::closed() {
  const std::lock_guard lock(power_mutex_);
  if (--open_ == 0) last_close();
}

void Card::unmapped(int count) {
  const std::lock_guard lock(power_mutex_);
  mapped_ -= count;
}

int Card::open_descriptors() {
  const std::lock_guard lock(power_mutex_);
  return open_;
}

int Card::open_mappings() {
  const std::lock_guard lock(power_mutex_);
  return mapped_;
}

bool Card::reset() {
  const std::lock_guard lock(power_mutex_);
  if (open_ > 0) return false;
  board_.reset();
  state_file_.clear();
  runner_.power_up();
  return true;
}

bool Card::set_clock(ClockMode mode, double speed) {
  const std::lock_guard lock(power_mutex_);
  if (open_ > 0) return false;
  board_.clock.power_up(mode, speed);
  runner_.power_up();
  return true;
}

void Card::power_off() {
  control_.stop();
  const std::lock_guard lock(power_mutex_);
  off_ = true;
  runner_.stop();
  if (open_ > 0) last_close();
}

}  // namespace virtual_card

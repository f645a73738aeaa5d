// Runs the channels, the audio inputs and the compositor for each field.
#include "engine.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <functional>
#include <mutex>
#include <optional>
#include <thread>

#include "audio_encoder.h"
#include "channel.h"
#include "compositor.h"
#include "host/worker_pool.h"

namespace virtual_card {

namespace {

constexpr unsigned kMaxThreads = 4;

unsigned thread_count() {
  return std::clamp(std::thread::hardware_concurrency(), 1u, kMaxThreads);
}

template <typename Part>
auto numbered(unsigned count) {
  std::vector<std::unique_ptr<Part>> parts;
  for (unsigned i = 0; i < count; ++i) parts.push_back(std::make_unique<Part>(i));
  return parts;
}

}  // namespace

struct Engine::Parts {
  Parts(FrameQueue &mpeg4_queue, FrameQueue &mjpeg_queue, FrameQueue &audio_queue)
      : mpeg4(mpeg4_queue), mjpeg(mjpeg_queue), audio(audio_queue), pool(thread_count()) {}

  void take_films();
  void queue_output(unsigned channel, std::chrono::microseconds time);

  FrameQueue &mpeg4;
  FrameQueue &mjpeg;
  FrameQueue &audio;
  WorkerPool pool;
  std::vector<std::unique_ptr<Channel>> channels = numbered<Channel>(kChannels);
  std::vector<std::unique_ptr<AudioEncoder>> inputs = numbered<AudioEncoder>(kAudioInputs);
  Compositor compositor;
  Field last;
  std::atomic<u32> motion{0};  ///< channel bits, written by field()

  std::mutex films_mutex;  ///< guards new_films
  std::array<std::optional<std::shared_ptr<Film>>, kChannels> new_films;
};

Engine::Engine(FrameQueue &mpeg4, FrameQueue &mjpeg, FrameQueue &audio)
    : parts_(std::make_unique<Parts>(mpeg4, mjpeg, audio)) {}

Engine::~Engine() = default;

void Engine::Parts::take_films() {
  const std::lock_guard lock(films_mutex);
  for (unsigned i = 0; i < kChannels; ++i) {
    if (!new_films[i]) continue;
    channels[i]->camera().show_film(*new_films[i]);
    new_films[i].reset();  // only now: after a bad_alloc the next field tries again
  }
}

void Engine::Parts::queue_output(unsigned channel, std::chrono::microseconds time) {
  const Channel::Output &output = channels[channel]->output();
  if (output.mpeg4.bitstream.empty()) {
    mpeg4.missed(1);
  } else {
    mpeg4.push_new(
        [&] { return mpeg4_frame(channel, output.mpeg4.intra ? 0 : 1, output.mpeg4.bitstream, time); });
  }
  if (output.jpeg.empty()) {
    mjpeg.missed(1);
  } else {
    mjpeg.push_new([&] { return mjpeg_frame(channel, output.size.width, output.size.height, output.jpeg); });
  }
}

void Engine::field(const CardState &state, const Field &field) {
  Parts &parts = *parts_;
  parts.last = field;
  parts.take_films();

  // From here on, a frame for which memory runs out is counted as lost.
  std::array<Channel::Work, kChannels> work;
  std::array<unsigned, kChannels> busy{};
  std::size_t jobs = 0;
  for (unsigned i = 0; i < kChannels; ++i) {
    work[i] = parts.channels[i]->work(state, field.number);
    if (work[i].any()) busy[jobs++] = i;
  }
  const auto process = [&](std::size_t job) {
    parts.channels[busy[job]]->process(state, field, work[busy[job]]);
  };
  if (jobs != 0) parts.pool.run(jobs, std::ref(process));
  // Queue in the order of the channels, in whatever order they became ready.
  for (unsigned i = 0; i < kChannels; ++i) {
    if (work[i].size) parts.queue_output(i, field.wall_time);
  }
  u32 motion = 0;
  for (unsigned i = 0; i < kChannels; ++i) {
    if (parts.channels[i]->motion().motion(field.number)) motion |= 1u << i;
  }
  parts.motion.store(motion, std::memory_order_relaxed);
}

void Engine::audio_block(const CardState &state, std::int64_t block) {
  parts_->audio.push_new([&] {
    ReadyFrame frame;
    frame.result = driver::kAudioReadCount;
    for (unsigned i = 0; i < kAudioInputs; ++i) {
      const auto bytes = parts_->inputs[i]->encode(block, ((state.sound_present >> i) & 1) != 0);
      frame.area.insert(frame.area.end(), bytes.begin(), bytes.end());
    }
    return frame;
  });
}

void Engine::compose(const CardState &state, std::span<u8> uyvy) {
  Parts &parts = *parts_;
  parts.take_films();
  const std::vector<View> windows = views(state);
  u32 shown = 0, both_fields = 0;
  for (const View &view : windows) {
    if (view.channel >= kChannels) continue;
    shown |= 1u << view.channel;
    if (view.both_fields) both_fields |= 1u << view.channel;
  }

  // Small windows show the newest top field, large ones the newest complete frame.
  const Field &last = parts.last;
  const bool whole = last.parity() != 0;
  const Field top = whole ? last.before() : last;
  const Field bottom = whole ? last : last.before();
  parts.pool.run(kChannels, [&](std::size_t i) {
    if (((shown >> i) & 1) == 0) return;
    if (((both_fields >> i) & 1) == 0) return parts.channels[i]->draw(state, top);
    parts.channels[i]->draw(state, bottom.before());
    parts.channels[i]->draw(state, bottom);
  });

  std::array<ViewSource, kChannels> sources;
  for (unsigned i = 0; i < kChannels; ++i) {
    if (((shown >> i) & 1) == 0) continue;
    MotionDetector &motion = parts.channels[i]->motion();
    sources[i].picture = &parts.channels[i]->camera().picture();
    if (state.display.motion_trace && motion.motion(parts.last.number)) sources[i].marks = &motion.blocks();
  }
  parts.compositor.compose(state, windows, sources, uyvy);
}

Picture Engine::look(const CardState &state, unsigned channel) {
  Parts &parts = *parts_;
  parts.take_films();
  const Field complete = parts.last.parity() != 0 ? parts.last : parts.last.before();
  Channel &shown = *parts.channels[channel];
  shown.draw(state, complete.before());
  shown.draw(state, complete);
  return shown.camera().picture();
}

u32 Engine::motion() const {
  return parts_->motion.load(std::memory_order_relaxed);
}

void Engine::set_thresholds(const driver::MotionMap &map) {
  if (map.channel < kChannels) parts_->channels[map.channel]->motion().set_thresholds(map);
}

void Engine::set_threshold(unsigned channel, u16 level) {
  if (channel < kChannels) parts_->channels[channel]->motion().set_threshold(level);
}

MotionThresholds Engine::thresholds(unsigned channel) const {
  return parts_->channels.at(channel)->motion().thresholds();
}

bool Engine::show_film(unsigned channel, const std::string &path, std::string *error) {
  if (channel >= kChannels) {
    if (error != nullptr) *error = "no channel " + std::to_string(channel);
    return false;
  }
  std::shared_ptr<Film> film;
  if (!path.empty()) {
    film = Film::open(path, error);
    if (!film) return false;
  }
  const std::lock_guard lock(parts_->films_mutex);
  parts_->new_films[channel] = std::move(film);
  return true;
}

void Engine::rest() {
  parts_->pool.stop();
}

void Engine::reset() {
  Parts &parts = *parts_;
  parts_ = std::make_unique<Parts>(parts.mpeg4, parts.mjpeg, parts.audio);
}

}  // namespace virtual_card

// The functions of virtual_card.h.

#include <stdexcept>

#include "card.h"
#include "host/message.h"

namespace virtual_card {
namespace {

Board &board() {
  return Card::instance().board();
}

/// Calls `use` with the settings while holding the board's mutex.
template <typename Use>
auto with_settings(Use use) {
  Board &card = board();
  const std::lock_guard lock(card.mutex);
  return use(card.settings);
}

void refused(const char *what) {
  print_message("%s refused: a device node is open or the value is wrong", what);
}

}  // namespace

void reset() {
  if (!Card::instance().reset()) refused("reset()");
}

int open_descriptors() {
  return Card::instance().open_descriptors();
}

int open_mappings() {
  return Card::instance().open_mappings();
}

void set_clock(ClockMode mode, double speed) {
  if (!(speed > 0) || !Card::instance().set_clock(mode, speed)) refused("set_clock()");
}

void advance(std::chrono::microseconds time) {
  Card::instance().runner().advance(time);
}

void advance_frames(int frames) {
  Card::instance().runner().advance_frames(frames);
}

void apply(const std::string &line) {
  if (const std::string error = board().apply(line); !error.empty()) throw std::invalid_argument(error);
}

std::vector<ItemText> items() {
  return item_texts();
}

void queue_mpeg4(ReadyFrame frame) {
  board().mpeg4.queue.push(std::move(frame));
}

void queue_mjpeg(ReadyFrame frame) {
  board().mjpeg.queue.push(std::move(frame));
}

void queue_audio(ReadyFrame blocks) {
  board().audio.queue.push(std::move(blocks));
}

void queue_preview(std::uint32_t index, long result) {
  with_settings([&](BoardSettings &settings) { settings.scripted_previews.emplace_back(index, result); });
}

void set_supply(Supply supply) {
  with_settings([&](BoardSettings &settings) { settings.supplied_since = board().clock.now(); });
  board().supplied = true;
  board().mpeg4.supply(std::move(supply.mpeg4), supply.video_rate, supply.limit);
  board().mjpeg.supply(std::move(supply.mjpeg), supply.video_rate, supply.limit);
  board().audio.supply(std::move(supply.audio), supply.audio_rate, supply.limit);
}

void clear_supply() {
  board().clear_supply();
}

std::uint32_t codec_register(std::uint32_t address) {
  return with_settings([&](BoardSettings &settings) { return settings.codec.read(address); });
}

void set_codec_register(std::uint32_t address, std::uint32_t value) {
  with_settings([&](BoardSettings &) { board().write_codec(address, value); });
}

std::uint32_t video_input_register(std::uint32_t address) {
  return with_settings([&](BoardSettings &settings) { return settings.video_input.read(address); });
}

void set_video_input_register(std::uint32_t address, std::uint32_t value) {
  with_settings([&](BoardSettings &) { board().write_video_input(address, value); });
}

std::uint8_t decoder_register(unsigned chip, unsigned address) {
  return with_settings(
      [&](BoardSettings &settings) { return settings.decoders.read(chip, address, settings.state); });
}

void set_decoder_register(unsigned chip, unsigned address, std::uint8_t value) {
  with_settings([&](BoardSettings &) { board().write_decoder(chip, address, value); });
}

void script_board_replies(std::uint32_t command, std::vector<std::uint32_t> replies) {
  with_settings([&](BoardSettings &settings) { settings.controller.script(command, replies); });
}

void script_motion(std::uint32_t bits) {
  with_settings([&](BoardSettings &settings) { settings.scripted_motion = bits; });
}

void set_motion_level(unsigned channel, std::uint16_t level) {
  with_settings([&](BoardSettings &settings) {
    settings.motion_level.at(channel) = level;
    board().engine.set_threshold(channel, level);
  });
}

void record_log(bool on) {
  board().log.record(on);
}

std::vector<Call> log() {
  return board().log.calls();
}

Counters counters() {
  Counters counters;
  counters.mpeg4 = board().mpeg4.queue.counters();
  counters.mjpeg = board().mjpeg.queue.counters();
  counters.audio = board().audio.queue.counters();
  with_settings([&](BoardSettings &settings) {
    counters.failed_calls = board().call_faults.hits();
    counters.previews = board().preview.composed;
    counters.watchdog_kicks = settings.controller.kicks();
    counters.watchdog_resets = settings.controller.resets();
    counters.watchdog_running = settings.controller.watchdog_running();
  });
  return counters;
}

}  // namespace virtual_card

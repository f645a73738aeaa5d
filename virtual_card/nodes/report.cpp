// Tells the card's state and counters as lines.
#include "report.h"

#include <sstream>

namespace virtual_card {
namespace {

const char *yes_or_no(bool value) {
  return value ? "yes" : "no";
}

const char *scale_name(u32 code) {
  switch (code) {
    case 0:
      return "off";
    case 1:
      return "half-d1";
    case driver::kScaleCodeD1:
      return "d1";
    default:
      return "cif";
  }
}

void tell_cameras(std::ostream &out, const CardState &state, const Conditions &conditions) {
  for (unsigned n = 0; n < kChannels; ++n) {
    const ChannelState &channel = state.channel[n];
    const auto film = conditions.films.find(n);
    const char *const scenes[] = {"moving", "still", "black"};
    const std::string shown =
        film != conditions.films.end() ? film->second : scenes[static_cast<std::size_t>(channel.scene)];
    const std::string name = "camera." + std::to_string(n + 1);
    out << name << ".signal " << (channel.lost ? "lost" : "present") << '\n';
    out << name << ".shows " << shown << '\n';
    out << name << ".hue " << int{channel.picture.hue} << '\n';
    out << name << ".saturation " << int{channel.picture.saturation} << '\n';
    out << name << ".contrast " << int{channel.picture.contrast} << '\n';
    out << name << ".brightness " << int{channel.picture.brightness} << '\n';
    out << name << ".mask " << channel.mask.x_start << ',' << channel.mask.y_start << ','
        << channel.mask.x_end << ',' << channel.mask.y_end << '\n';
    out << name << ".motion-detection " << yes_or_no((state.motion_enable >> n & 1) != 0) << '\n';
  }
}

void tell_encoders(std::ostream &out, const CardState &state) {
  for (unsigned n = 0; n < kChannels; ++n) {
    const EncoderSettings &encoder = state.channel[n].encoder;
    const std::string name = "encoder." + std::to_string(n + 1);
    out << name << ".scale " << scale_name(encoder.scale_code) << '\n';
    if (encoder.scale_code == 0) continue;
    out << name << ".skipped-frames " << (encoder.interval_code & driver::kIntervalSkipMask) << '\n';
    out << name << ".drop-mode " << yes_or_no((encoder.interval_code >> driver::kIntervalDropShift & 1) != 0)
        << '\n';
    out << name << ".gop " << encoder.gop << '\n';
    if (encoder.cbr.enable != 0)
      out << name << ".bits-per-second " << encoder.cbr.value << '\n';
    else
      out << name << ".qp " << encoder.qp << '\n';
    out << name << ".number-shown " << yes_or_no(encoder.number_overlay) << '\n';
  }
}

void tell_display(std::ostream &out, const DisplayState &display) {
  out << "display.on " << yes_or_no(display.on) << '\n';
  out << "display.motion-marks " << yes_or_no(display.motion_trace) << '\n';
  out << "display.zoom-level " << display.layout.zoom.level << '\n';
  for (unsigned n = 0; n < display.layout.window.size(); ++n) {
    const ZV_DISPLAY_WINDOW &window = display.layout.window[n];
    if ((window.flags & ZV_WINDOW_ENABLED) == 0) continue;
    const std::string name = "window." + std::to_string(n + 1);
    out << name << ".channel " << display.routing[n] + 1 << '\n';
    out << name << ".area " << window.x_start << ',' << window.y_start << ',' << window.x_end << ','
        << window.y_end << '\n';
    out << name << ".picture-in-picture " << yes_or_no((window.flags & ZV_WINDOW_PIP) != 0) << '\n';
  }
}

void tell_stream(std::ostream &out, const char *name, const StreamCounters &counters) {
  out << name << ".made " << counters.made << '\n';
  out << name << ".delivered " << counters.delivered << '\n';
  out << name << ".lost " << counters.lost << '\n';
}

}  // namespace

std::string state_report(Board &board) {
  std::ostringstream out;
  const std::lock_guard lock(board.mutex);
  const CardState &state = board.settings.state;
  out << "standard " << (state.standard == VIDEO_STANDARD_ZV_PAL ? "PAL" : "NTSC") << '\n';
  out << "width " << state.width << '\n';
  out << "encoding " << yes_or_no(state.encoding) << '\n';
  tell_cameras(out, state, board.conditions);
  for (unsigned n = 0; n < kAudioInputs; ++n)
    out << "input." << n + 1 << ".sound " << yes_or_no((state.sound_present >> n & 1) != 0) << '\n';
  tell_encoders(out, state);
  tell_display(out, state.display);
  out << "watchdog.running " << yes_or_no(board.settings.controller.watchdog_running()) << '\n';
  return out.str();
}

std::string counters_report(const Counters &counters) {
  std::ostringstream out;
  tell_stream(out, "mpeg4", counters.mpeg4);
  tell_stream(out, "mjpeg", counters.mjpeg);
  tell_stream(out, "audio", counters.audio);
  out << "previews " << counters.previews << '\n';
  out << "failed-calls " << counters.failed_calls << '\n';
  out << "watchdog.kicks " << counters.watchdog_kicks << '\n';
  out << "watchdog.resets " << counters.watchdog_resets << '\n';
  return out.str();
}

}  // namespace virtual_card

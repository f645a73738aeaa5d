// Notes what the card has, and puts it back.
#include "found_state.h"

#include <sys/mman.h>

#include <algorithm>
#include <stdexcept>
#include <thread>

#include "preview_picture.h"
#include "zv_display.h"

namespace contract {
namespace {

constexpr u32 kPalFieldLines = 288;
constexpr u32 kNarrow = 704;

/// Reads a preview picture at the driver's level. Returns an empty image if none comes within a second.
Image picture_of(const Nodes &nodes, u32 width, u32 height) {
  std::array<std::unique_ptr<Mapping>, driver::kPreviewBuffers> buffers;
  for (u32 n = 0; n < buffers.size(); ++n) {
    u32 index = n;
    nodes.issue(kDisplay, driver::DISP_IOC_SELECT_BUFFER, &index);
    buffers[n] = std::make_unique<Mapping>(nodes.fd(kDisplay), driver::kPreviewBufferSize, PROT_READ);
  }
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_ON);
  Image image;
  for (int attempt = 0; attempt < 200 && image.empty(); ++attempt) {
    u32 index = 0;
    const long size = read_preview(nodes.fd(kDisplay), index);
    if (size == static_cast<long>(std::size_t{width} * height * 2) &&
        size <= static_cast<long>(driver::kPreviewBufferSize) && index < driver::kPreviewBuffers &&
        buffers[index]->bytes() != nullptr)
      image = unpacked(buffers[index]->bytes(), width, height);
    else
      std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_OFF);
  return image;
}

/// Borders of windows: the pixels of a preview without pictures that are not black.
bool border(const Image &layout, std::size_t at) {
  constexpr u8 kDark = 40;
  return layout.y[at] > kDark;
}

/// Returns the number of border pixels of a layout if they are all in the picture, else 0. A few may be
/// hidden.
std::size_t borders_in(const Image &picture, const Image &layout) {
  constexpr int kClose = 12;
  if (picture.y.size() != layout.y.size()) return 0;
  std::size_t borders = 0, seen = 0;
  for (std::size_t at = 0; at < layout.y.size(); ++at) {
    if (!border(layout, at)) continue;
    ++borders;
    seen += std::abs(picture.y[at] - layout.y[at]) <= kClose ? 1 : 0;
  }
  return seen * 100 >= borders * 98 ? borders : 0;
}

bool disabled_in(const Image &picture, const ZV_DISPLAY_WINDOW &window) {
  constexpr u32 kInset = 8;
  if (picture.empty()) return false;
  const Tones found = tones(picture, {window.x_start + kInset, window.y_start + kInset, window.x_end - kInset,
                                      window.y_end - kInset});
  return found.luma < 20 && found.deviation < 2;
}

/// Puts a setting of an encoder back, if it has changed.
void write_back(const Nodes &nodes, u32 get, u32 set, driver::ChannelValue found) {
  driver::ChannelValue now{found.channel, 0};
  if (nodes.issue(kEncoder, get, &now) != 0 || now.value == found.value) return;
  nodes.issue(kEncoder, set, &found);
}

}  // namespace

FoundState::FoundState(Nodes &nodes) {
  u32 width = 0, lines = 0;
  nodes.issue(kDisplay, driver::DISP_IOC_GET_WIDTH, &width);
  nodes.issue(kDisplay, driver::DISP_IOC_GET_HEIGHT, &lines);
  if (lines == kPalFieldLines) standard_ = VIDEO_STANDARD_ZV_PAL;
  if (width == kNarrow) resolution_ = RESOLUTION_ZV_704;
  preview_ = picture_of(nodes, width, 2 * lines);
  note_registers(nodes);
  note_encoders(nodes);
  note_motion_levels(nodes);
}

void FoundState::note_registers(const Nodes &nodes) {
  constexpr u32 kCodec[] = {driver::kRegMotionEnable, driver::kRegMotionControl, driver::kRegMjpegQuality,
                            driver::kRegDisplayState};
  for (const u32 address : kCodec) {
    driver::Register found{address, 0};
    if (nodes.issue(kDisplay, driver::DISP_IOC_READ_REG, &found) != 0) continue;
    undo_.emplace_back([found](const Nodes &card) {
      if (card.codec(found.address) != found.value) card.write_codec(found.address, found.value);
    });
  }
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    routed_[n] = n;
    for (const u32 first : {driver::kRegRouting, driver::kRegPrivacyMask}) {
      driver::Register found{first + 4 * n, 0};
      if (nodes.issue(kVideoInput, driver::VIN_IOC_READ_REG, &found) != 0) continue;
      if (first == driver::kRegRouting) routed_[n] = found.value >> driver::kRoutingShift;
      undo_.emplace_back([found](const Nodes &card) {
        if (card.video_input(found.address) != found.value)
          card.write_video_input(found.address, found.value);
      });
    }
  }
  const auto note_decoder = [&](u8 chip, u8 address) {
    driver::DecoderRegister found{chip, address, 0};
    if (nodes.issue(kVideoInput, driver::VIN_IOC_READ_TW2815, &found) != 0) return;
    undo_.emplace_back([found](const Nodes &card) {
      if (card.decoder(found.chip, found.address) != found.value)
        card.write_decoder(found.chip, found.address, found.value);
    });
  };
  for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
    for (u8 n = 0; n < driver::kChannelsPerChip; ++n)
      for (u8 property = 0; property < 4; ++property)
        note_decoder(
            chip, static_cast<u8>(driver::kDecoderProperty + driver::kDecoderChannelStride * n + property));
  for (const auto &[address, value] : driver::kDecoderSetup) note_decoder(0, address);
}

void FoundState::note_encoders(const Nodes &nodes) {
  constexpr std::pair<u32, u32> kWords[] = {{driver::ENC_IOC_GET_SCALE, driver::ENC_IOC_SET_SCALE},
                                            {driver::ENC_IOC_GET_GOP, driver::ENC_IOC_SET_GOP},
                                            {driver::ENC_IOC_GET_QP, driver::ENC_IOC_SET_QP}};
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    for (const auto &[get, set] : kWords) {
      driver::ChannelValue found{channel, 0};
      if (nodes.issue(kEncoder, get, &found) != 0) continue;
      undo_.emplace_back(
          [get = get, set = set, found](const Nodes &card) { write_back(card, get, set, found); });
    }
    driver::Interval found{channel, 0, 0};
    if (nodes.issue(kEncoder, driver::ENC_IOC_GET_INTERVAL, &found) != 0) continue;
    found.drop = found.code >> driver::kIntervalDropShift & 1;
    undo_.emplace_back([found](const Nodes &card) {
      driver::Interval now{found.channel, 0, 0};
      if (card.issue(kEncoder, driver::ENC_IOC_GET_INTERVAL, &now) != 0 || now.code == found.code) return;
      driver::Interval back = found;
      card.issue(kEncoder, driver::ENC_IOC_SET_INTERVAL, &back);
    });
  }
}

void FoundState::note_motion_levels(const Nodes &nodes) {
  driver::MotionLevels found{};
  if (nodes.issue(kVideoInput, driver::VIN_IOC_GET_MOTION_LEVELS, &found) != 0) return;
  undo_.emplace_back([found](const Nodes &card) {
    driver::MotionLevels now{};
    if (card.issue(kVideoInput, driver::VIN_IOC_GET_MOTION_LEVELS, &now) != 0) return;
    for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
      // A channel that no check has touched keeps its map, which may have excluded areas.
      if (now.level[channel] == found.level[channel]) continue;
      constexpr u32 kSide = driver::kMotionMapSide;
      const std::vector<u16> thresholds(std::size_t{kSide} * kSide, found.level[channel]);
      driver::MotionMap map{channel, 0, 0, kSide, kSide, thresholds.data()};
      card.issue(kVideoInput, driver::VIN_IOC_SET_MOTION_MAP, &map);
    }
  });
}

void FoundState::restore_layout(HANDLE card) const {
  zv_SetVideoStandard(card, standard_);
  zv_SetResolution(card, resolution_);
  u32 mode = MUX_MODE_ZV_INVALID;
  std::size_t most = 0;
  for (u32 candidate = 0; candidate < MUX_MODE_ZV_INVALID; ++candidate) {
    ZV_DISPLAY *display = zv_display_open(card, candidate);
    if (display == nullptr) throw std::runtime_error("zv_display_open fails: the layout is not put back");
    for (u32 n = 0; n < ZV_CHANNELS; ++n) zv_display_channel_mode(display, n, 0);
    issue(display->fd, driver::DISP_IOC_PREVIEW_ON);
    const std::size_t borders = preview_.empty() ? 0 : borders_in(preview_, settled_preview(card));
    if (borders > most) {
      most = borders;
      mode = candidate;
    }
  }
  no_layout_ =
      mode == MUX_MODE_ZV_INVALID && !preview_.empty() && tones(preview_, preview_.all()).deviation < 1;
  if (no_layout_) return;
  const ZV_DISPLAY *const display =
      zv_display_open(card, mode == MUX_MODE_ZV_INVALID ? u32{MUX_MODE_ZV_1CH} : mode);
  if (display == nullptr) throw std::runtime_error("zv_display_open fails: the layout is not put back");
  const u32 hidden_flags = disabled_in(preview_, display->window[0]) ? 0 : ZV_WINDOW_ENABLED;
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    ZV_DISPLAY_WINDOW window = display->window[n];
    window.channel = routed_[n];
    const bool shown = window.x_end > window.x_start;
    window.flags = shown && !disabled_in(preview_, window) ? ZV_WINDOW_ENABLED : shown ? 0 : hidden_flags;
    issue(display->fd, driver::DISP_IOC_SET_WINDOW, &window);
  }
}

/// Brings the layout of power-up back: no windows and no borders.
void FoundState::clear_layout(const Nodes &nodes) const {
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    ZV_DISPLAY_WINDOW window{n, n, 0, 0, 0, 0, 0, 0};
    nodes.issue(kDisplay, driver::DISP_IOC_SET_WINDOW, &window);
  }
  driver::Grid grid{};
  nodes.issue(kDisplay, driver::DISP_IOC_SET_GRID, &grid);
  for (const u32 number : {driver::kScreenFrame, driver::kPipFrame}) {
    driver::FrameRect rect{number, 0, 0, 0, 0, 0, 0};
    nodes.issue(kDisplay, driver::DISP_IOC_SET_RECT, &rect);
  }
}

void FoundState::restore(const Nodes &nodes) const {
  u32 width = resolution_ == RESOLUTION_ZV_704 ? kNarrow : 720;
  nodes.set_standard(standard_);
  nodes.issue(kVideoInput, driver::VIN_IOC_SET_WIDTH, &width);
  if (no_layout_) clear_layout(nodes);
  std::string failure;
  for (const auto &undo : undo_) {
    try {
      undo(nodes);
    } catch (const std::runtime_error &error) {
      failure = error.what();
    }
  }
  if (!failure.empty()) throw std::runtime_error(failure);
}

}  // namespace contract

// Saves the state of the card as driver commands, and carries them out again.
#include "state_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <new>
#include <set>
#include <sstream>

#include "commands.h"
#include "describe.h"
#include "host/files.h"
#include "host/real_calls.h"

namespace virtual_card {
namespace {

// A line of the file is a command as the log shows it. A motion map has one threshold for all of its blocks.

constexpr const char *kTitle =
    "# State of the virtual card: the driver commands that lead to it from power-up.\n";
constexpr std::string_view kThreshold = "threshold=";
constexpr std::string_view kChecksum = "checksum ";

std::string checksum_line(std::string_view text) {
  std::uint32_t sum = 2166136261;  // FNV-1a
  for (const char character : text) sum = (sum ^ static_cast<u8>(character)) * 16777619;
  return std::string(kChecksum) + std::to_string(sum) + "\n";
}

// --- From the state to lines

class Lines {
 public:
  template <typename Record>
  std::string &add(u32 code, const Record &record) {
    const std::span bytes(reinterpret_cast<const u8 *>(&record), sizeof record);
    return lines.emplace_back(describe_command(*command_with(Device::none, code), bytes));
  }
  void add(u32 code) { lines.emplace_back(command_with(Device::none, code)->name); }

  std::vector<std::string> lines;
};

void add_encoder(Lines &lines, u32 channel, const EncoderSettings &encoder) {
  lines.add(driver::ENC_IOC_SET_SCALE, driver::ChannelValue{channel, encoder.scale_code});
  const u32 drop = encoder.interval_code >> driver::kIntervalDropShift & 1;
  lines.add(driver::ENC_IOC_SET_INTERVAL, driver::Interval{channel, encoder.interval_code, drop});
  lines.add(driver::ENC_IOC_SET_GOP, driver::ChannelValue{channel, encoder.gop});
  lines.add(driver::ENC_IOC_SET_QP, driver::ChannelValue{channel, encoder.qp});
  driver::Cbr cbr = encoder.cbr;
  cbr.channel = channel;
  lines.add(driver::ENC_IOC_SET_CBR, cbr);
  driver::QpRange range = encoder.qp_range;
  range.channel = channel;
  lines.add(driver::ENC_IOC_SET_QP_RANGE, range);
  lines.add(encoder.number_overlay ? driver::ENC_IOC_CHANNEL_NUMBER_ON : driver::ENC_IOC_CHANNEL_NUMBER_OFF,
            channel);
}

void add_registers(Lines &lines, const BoardSettings &settings) {
  // A register that was never written and one that holds its power-up value again are the same state.
  const auto add_changed = [&](u32 code, const RegisterFile &chip, const RegisterFile &at_power_up) {
    for (const auto &[address, value] : chip.words())
      if (value != at_power_up.read(address)) lines.add(code, driver::Register{address, value});
  };
  add_changed(driver::DISP_IOC_WRITE_REG, settings.codec, codec_at_power_up());
  add_changed(driver::VIN_IOC_WRITE_REG, settings.video_input, video_input_at_power_up());
  for (u8 chip = 0; chip < driver::kDecoderChips; ++chip)
    for (unsigned address = 0; address < DecoderChips::kRegisters; ++address)
      if (const auto value = settings.decoders.written(chip, address))
        lines.add(driver::VIN_IOC_WRITE_TW2815,
                  driver::DecoderRegister{chip, static_cast<u8>(address), *value});
}

void add_display(Lines &lines, const BoardSettings &settings) {
  const DisplayState &display = settings.state.display;
  for (const ZV_DISPLAY_WINDOW &window : display.layout.window)
    lines.add(driver::DISP_IOC_SET_WINDOW, window);
  lines.add(driver::DISP_IOC_SET_ZOOM, display.layout.zoom);
  lines.add(driver::DISP_IOC_SET_GRID, display.layout.grid);
  for (u32 number = 0; number < display.layout.frame.size(); ++number) {
    driver::FrameRect frame = display.layout.frame[number];
    frame.number = number;
    lines.add(driver::DISP_IOC_SET_RECT, frame);
  }
  lines.add(display.motion_trace ? driver::DISP_IOC_MOTION_TRACE_ON : driver::DISP_IOC_MOTION_TRACE_OFF);
  lines.add(driver::DISP_IOC_SELECT_BUFFER, settings.selected_buffer);
}

/// Adds a map of one threshold for the whole channel, and then the parts of its rows that differ.
void add_motion(Lines &lines, u32 channel, u16 level, const MotionThresholds &map) {
  constexpr u32 kSide = driver::kMotionMapSide;
  const auto add = [&](u32 column, u32 row, u32 columns, u32 rows, u16 threshold) {
    lines.add(driver::VIN_IOC_SET_MOTION_MAP,
              driver::MotionMap{channel, column, row, columns, rows, nullptr}) +=
        " " + std::string(kThreshold) + std::to_string(threshold);
  };
  add(0, 0, kSide, kSide, level);
  for (u32 row = 0; row < kSide; ++row) {
    const u16 *const blocks = map.data() + std::size_t{row} * kSide;
    for (u32 first = 0, end = 0; first < kSide; first = end) {
      while (end < kSide && blocks[end] == blocks[first]) ++end;
      if (blocks[first] != level) add(first, row, end - first, 1, blocks[first]);
    }
  }
}

template <typename ThresholdsOf>
std::vector<std::string> lines_of(const BoardSettings &settings, ThresholdsOf thresholds_of) {
  Lines lines;
  lines.add(driver::VIN_IOC_SET_STANDARD, settings.state.standard);
  lines.add(driver::VIN_IOC_SET_WIDTH, settings.state.width);
  add_registers(lines, settings);
  for (u32 n = 0; n < kChannels; ++n) add_encoder(lines, n, settings.state.channel[n].encoder);
  add_display(lines, settings);
  for (u32 n = 0; n < kChannels; ++n) add_motion(lines, n, settings.motion_level[n], thresholds_of(n));
  return lines.lines;
}

/// The text of the file: the lines that differ from those of a card at power-up.
std::string text_of(Board &board) {
  const BoardSettings now = [&] {
    const std::lock_guard lock(board.mutex);
    return board.settings;
  }();
  const auto usual = lines_of(BoardSettings{}, [](u32) { return MotionDetector{}.thresholds(); });
  const std::set<std::string> at_power_up(usual.begin(), usual.end());
  std::string text = kTitle;
  for (const std::string &line : lines_of(now, [&](u32 n) { return board.engine.thresholds(n); }))
    if (at_power_up.count(line) == 0) text += line + "\n";
  return text + checksum_line(text);
}

// --- From a line to the state

struct Record {
  alignas(std::max_align_t) std::array<u8, kMaxRecord> bytes{};
  std::vector<u16> thresholds;  ///< what the record of a motion map points to

  /// Reads " name=value ..." as far as it goes.
  Record(const CommandRow &row, std::istream &fields) {
    std::string field;
    for (u8 *place = bytes.data(); fields >> field; place += row.fields.width) {
      if (place + row.fields.width > bytes.data() + bytes.size()) return;
      const std::size_t name_size = field.find('=') + 1;
      const auto value = static_cast<u32>(std::strtoul(field.c_str() + name_size, nullptr, 0));
      if (field.substr(0, name_size) == kThreshold) {
        thresholds.assign(MotionThresholds{}.size(), static_cast<u16>(value));
        const u16 *const address = thresholds.data();
        std::memcpy(bytes.data() + offsetof(driver::MotionMap, thresholds), &address, sizeof address);
        return;
      }
      std::memcpy(place, &value, row.fields.width);  // little-endian
    }
  }
};

bool carry_out(const std::string &line, Nodes nodes) {
  std::istringstream words(line);
  std::string name;
  words >> name;
  for (std::size_t n = 0; n < nodes.size(); ++n) {
    const CommandRow *const row = command_named(static_cast<Device>(n), name);
    if (row == nullptr) continue;
    Record record(*row, words);
    return nodes[n]->execute(*row, record.bytes.data()) == 0;
  }
  return false;
}

}  // namespace

std::string load_state(const std::string &path, Nodes nodes) {
  struct stat status {};
  if (::stat(path.c_str(), &status) != 0) {
    const int error = errno;
    const std::string folder = path.substr(0, path.rfind('/') + 1);
    return error == ENOENT && ::stat(folder.c_str(), &status) == 0 ? std::string() : std::strerror(error);
  }
  if (!S_ISREG(status.st_mode)) return "not a regular file";
  std::ifstream file(path, std::ios::binary);
  if (!file) return std::strerror(errno);
  std::ostringstream content;
  content << file.rdbuf();
  const std::string text = content.str();
  const std::size_t end = std::min(text.rfind(kChecksum), text.size());
  if (text.substr(end) != checksum_line(text.substr(0, end)))
    return "the file is damaged: its checksum is wrong";
  std::istringstream lines(text.substr(0, end));
  for (std::string line; std::getline(lines, line);)
    if (line[0] != '#' && !carry_out(line, nodes)) return "the card cannot carry out \"" + line + "\"";
  return {};
}

std::string save_state(const std::string &path, Board &board) try {
  const std::string text = text_of(board);
  const std::string next = path + ".new." + std::to_string(::getpid());
  ::unlink(next.c_str());
  const int fd = real::open(real::Name::open, next.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
  if (fd < 0) return std::strerror(errno);
  long error = write_all(fd, text);
  if (error == 0 && ::fsync(fd) != 0) error = -errno;
  if (real::close(fd) != 0 && error == 0) error = -errno;
  if (error == 0 && ::rename(next.c_str(), path.c_str()) != 0) error = -errno;
  if (error == 0) return {};
  ::unlink(next.c_str());
  return std::strerror(static_cast<int>(-error));
} catch (const std::bad_alloc &) {
  return "out of memory";
}

}  // namespace virtual_card

/**
 * @file device.h
 * A device node of the card. Its functions correspond to those of a kernel driver: results below zero are
 * negated error numbers.
 */
#ifndef VIRTUAL_CARD_DEVICE_H
#define VIRTUAL_CARD_DEVICE_H

#include "board.h"

namespace virtual_card {

class DeviceNode;

/// The names of a record's fields, for people, and how wide each is.
struct RecordFields {
  const char *names;
  std::size_t width = sizeof(u32);
  bool hexadecimal = false;
};
template <typename Record>
inline constexpr RecordFields kRecordFields{""};
template <>
inline constexpr RecordFields kRecordFields<u32>{"value"};
template <>
inline constexpr RecordFields kRecordFields<driver::ChannelValue>{"channel value"};
template <>
inline constexpr RecordFields kRecordFields<driver::Interval>{"channel code drop"};
template <>
inline constexpr RecordFields kRecordFields<driver::Cbr>{"channel value enable"};
template <>
inline constexpr RecordFields kRecordFields<driver::QpRange>{"channel max min enable"};
template <>
inline constexpr RecordFields kRecordFields<driver::Register>{"address value", sizeof(u32), true};
template <>
inline constexpr RecordFields kRecordFields<driver::Zoom>{"level x y"};
template <>
inline constexpr RecordFields kRecordFields<driver::Grid>{
    "column column column column column row row row row row cells"};
template <>
inline constexpr RecordFields kRecordFields<driver::FrameRect>{"number x_start y_start x_end y_end enable"};
template <>
inline constexpr RecordFields kRecordFields<driver::Mask>{"channel x_start x_end y_start y_end"};
template <>
inline constexpr RecordFields kRecordFields<driver::MotionMap>{"channel column row columns rows"};
template <>
inline constexpr RecordFields kRecordFields<driver::DecoderRegister>{"chip address value", sizeof(u8), true};
template <>
inline constexpr RecordFields kRecordFields<driver::BoardCommand>{"command reply", sizeof(u32), true};
template <>
inline constexpr RecordFields kRecordFields<driver::MotionLevels>{
    "level level level level level level level level level level level level level level level level",
    sizeof(u16)};
template <>
inline constexpr RecordFields kRecordFields<ZV_DISPLAY_WINDOW>{
    "index channel scale x_start y_start x_end y_end flags"};

/// A command that a node has. The node copies the record in, checks the first word if it is a channel, calls
/// the handler with the board locked, and copies the record back if the command answers.
struct CommandRow {
  const char *name;
  u32 code;
  std::size_t size;
  bool channel_first;
  bool answers;
  RecordFields fields;
  long (*handler)(DeviceNode &node, void *record);
};

class DeviceNode {
 public:
  DeviceNode(Board &board, Device device, Region &region) : board_(board), device_(device), region_(region) {}
  virtual ~DeviceNode() = default;
  DeviceNode(const DeviceNode &) = delete;
  DeviceNode &operator=(const DeviceNode &) = delete;

  long ioctl(u32 code, std::uintptr_t argument);
  virtual long read(std::uintptr_t buffer, std::size_t count);
  /// Returns the offset in the region at which a mapping of the node starts.
  virtual long place_mapping(std::size_t length, int protection, off_t offset);

  Region &region() { return region_; }
  /// Carries out a command of this node. Returns 0 or a negated error number. `record` has row.size bytes.
  long execute(const CommandRow &row, void *record);

 protected:
  /// Appends to the log the data that a record points to.
  virtual void log_pointed_to(u32, const void *, std::vector<u8> &) const {}

  Board &board_;

 private:
  /// Runs a command. `record` receives the record as it is in the end; `logged`, if not null, the record as
  /// it came in.
  long run(u32 code, const CommandRow *row, std::uintptr_t argument, std::span<u8> record, Call *logged);

  Device device_;
  Region &region_;
};

/// Upper limit of the size of a command's record.
inline constexpr std::size_t kMaxRecord = 64;

namespace detail {

template <typename Method>
struct Signature;
template <typename Class, typename Argument>
struct Signature<long (Class::*)(Argument &)> {
  using Node = Class;
  using Record = Argument;
  static constexpr std::size_t kSize = sizeof(Argument);
};
template <typename Class>
struct Signature<long (Class::*)()> {
  using Node = Class;
  using Record = void;
  static constexpr std::size_t kSize = 0;
};

template <auto Method>
long call(DeviceNode &node, void *record) {
  using Types = Signature<decltype(Method)>;
  auto &self = static_cast<typename Types::Node &>(node);
  if constexpr (Types::kSize == 0)
    return (self.*Method)();
  else
    return (self.*Method)(*static_cast<typename Types::Record *>(record));
}

}  // namespace detail

enum class First { word, channel };
enum class Answer { no, yes };

template <auto Method>
constexpr CommandRow command(const char *name, u32 code, First first = First::word,
                             Answer answer = Answer::no) {
  constexpr std::size_t size = detail::Signature<decltype(Method)>::kSize;
  static_assert(size <= kMaxRecord);
  constexpr RecordFields fields = kRecordFields<typename detail::Signature<decltype(Method)>::Record>;
  return {name, code, size, first == First::channel, answer == Answer::yes, fields, &detail::call<Method>};
}

/// The row of a command of zv_driver.h. Further arguments are those of command().
#define VIRTUAL_CARD_COMMAND(method, code, ...) \
  command<&method>(#code, driver::code __VA_OPT__(, ) __VA_ARGS__)

}  // namespace virtual_card

#endif

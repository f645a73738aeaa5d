// Writes calls on device nodes as lines for people.
#include "describe.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "commands.h"
#include "item_values.h"

namespace virtual_card {
namespace {

constexpr u32 kLastDecimal = 9999;

/// Reads the next field of a record, which is 1, 2 or 4 bytes wide.
u32 take_field(std::span<const u8> &record, std::size_t width) {
  u32 value = 0;
  width = std::min(width, record.size());
  std::memcpy(&value, record.data(), width);
  record = record.subspan(width);
  return value;
}

std::string number(u32 value, bool hexadecimal) {
  char text[16];
  std::snprintf(text, sizeof text, hexadecimal ? "0x%x" : "%u", value);
  return text;
}

}  // namespace

std::string describe_command(const CommandRow &row, std::span<const u8> record) {
  const RecordFields &fields = row.fields;
  std::string text = row.name;
  for (std::string_view names = fields.names; !names.empty() && !record.empty();) {
    const auto [name, rest] = split(names, ' ');
    // Most values above the limit are masks or packed words, which are read in hexadecimal.
    const u32 value = take_field(record, fields.width);
    text += " " + std::string(name) + "=" + number(value, value > kLastDecimal || fields.hexadecimal);
    names = rest;
  }
  return text;
}

std::string describe(const Call &call, const CommandRow *row, std::span<const u8> record,
                     std::chrono::nanoseconds time) {
  char stamp[32];
  std::snprintf(stamp, sizeof stamp, "%.6f ", std::chrono::duration<double>(time).count());
  std::string line = std::string(stamp) + name_of(call.device) + " " + name_of(call.operation);
  if (row != nullptr) {
    line += " " + describe_command(*row, record);
  } else if (call.operation == Operation::ioctl) {
    line += " " + number(call.code, true);
  }
  if (call.size != 0) line += " size=" + std::to_string(call.size);
  line += " = " + std::to_string(call.result);
  if (const char *error = call.error != 0 ? strerrorname_np(call.error) : nullptr)
    line += std::string(" ") + error;
  return line + "\n";
}

}  // namespace virtual_card

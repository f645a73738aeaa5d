// Writes and reads the lines of an index.
#include "recording/index.h"

#include <fstream>
#include <nlohmann/json.hpp>
#include <type_traits>

namespace recording {
namespace {

using Json = nlohmann::json;
using Kind = IndexEntry::Kind;

constexpr const char *kEvents[] = {nullptr, "start", "stop", "gap", "buffer", "disk", "standard"};  // by Kind

/// Passes each key of a kind of line, with its value, to `field`, in the order of the line.
template <typename Entry, typename Field>
void for_each_field(Entry &entry, const Field &field) {
  const Kind kind = entry.kind;
  field("time", entry.time);
  field("offset", entry.offset);
  if (kind == Kind::intra || kind == Kind::stop || kind == Kind::buffer) field("frames", entry.frames);
  if (kind == Kind::intra || kind == Kind::stop) {
    field("bytes", entry.bytes);
    field("motion", entry.motion);
    field("lost", entry.lost);
  }
  if (kind == Kind::start || kind == Kind::standard) field("standard", entry.standard);
  if (kind == Kind::start) {
    field("rate", entry.rate);
    field("fields", entry.fields);
    field("audio", entry.audio);
  }
  if (kind == Kind::gap) field("ms", entry.ms);
  if (kind == Kind::disk) field("error", entry.error);
}

std::optional<Kind> kind_of(const Json &line) {
  if (line.value("intra", false)) return Kind::intra;
  const std::string event = line.value("event", "");
  for (std::size_t kind = 1; kind < std::size(kEvents); ++kind)
    if (event == kEvents[kind]) return static_cast<Kind>(kind);
  return std::nullopt;
}

}  // namespace

std::string to_line(const IndexEntry &entry) {
  std::string line = entry.kind == Kind::intra ? "{\"intra\":true" : "{\"event\":\"";
  if (entry.kind != Kind::intra) line.append(kEvents[static_cast<std::size_t>(entry.kind)]).append("\"");
  for_each_field(entry, [&line](const char *key, const auto &value) {
    line.append(",\"").append(key).append("\":");
    // A Motion-JPEG recording has a line for each frame, so numbers take the short way.
    if constexpr (std::is_integral_v<std::decay_t<decltype(value)>>)
      line += std::to_string(value);
    else
      line += Json(value).dump(-1, ' ', false, Json::error_handler_t::replace);
  });
  return line + "}\n";
}

std::optional<IndexEntry> parse_line(std::string_view line) try {
  const Json object = Json::parse(line);
  const std::optional<Kind> kind = kind_of(object);
  if (!kind) return std::nullopt;
  IndexEntry entry;
  entry.kind = *kind;
  for_each_field(entry, [&](const char *key, auto &value) { object.at(key).get_to(value); });
  return entry;
} catch (const Json::exception &) {
  return std::nullopt;
}

std::vector<IndexEntry> read_index(const std::string &path) {
  std::vector<IndexEntry> entries;
  std::ifstream file(path);
  for (std::string line; std::getline(file, line);)
    if (std::optional<IndexEntry> entry = parse_line(line)) entries.push_back(std::move(*entry));
  return entries;
}

std::string index_path(const std::string &recording_path) {
  const bool known = recording_path.ends_with(".rec") || recording_path.ends_with(".aud");
  return recording_path.substr(0, known ? recording_path.size() - 4 : std::string::npos) + ".idx";
}

}  // namespace recording

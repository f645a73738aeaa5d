// zarvo_card: changes, breaks and watches the virtual card of a running program.
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <nlohmann/json.hpp>
#include <sstream>
#include <string>
#include <vector>

#include "client.h"
#include "png_file.h"
#include "programs/common/command_line.h"
#include "virtual_card.h"

namespace {

constexpr int kFailed = 1;
constexpr int kWrongUse = 2;

constexpr const char *kUsage = R"(Usage: zarvo_card [OPTION...] ITEM...
       zarvo_card [OPTION...] state | counters | log | snapshot CHANNEL FILE

Changes, breaks and watches the virtual card of a running program. The card listens if ZARVO_VIRTUAL_CARD
held the item control=SOCKET when the program was started.

  ITEM                      e.g. lost=3; "lost=" undoes it. With a time, counted from now (quote it):
                            "@5-8 lost=3", "@12 lost=3", "@every 10 for 0.5 stall=mpeg4"
  reset                     undoes all items but those of power-up
  state                     cameras, inputs, encoders, layout and watchdog
  counters                  frames made, delivered and lost; previews; watchdog
  log                       every call on a device node as it comes
  snapshot CHANNEL FILE     writes what a camera shows to FILE (.png or .ppm)

  --socket PATH             the card's socket; without it $ZARVO_CARD_SOCKET
  --list                    lists the items: usage, values, effect on the program
  --json                    state and counters as JSON
  --only NODE               log: only encoder, display, audio or video_input
  --no-reads                log: leaves out reads, and commands that request or release a frame
  -h, --help                shows this text
  --version                 shows the version

Exit status: 0 done, 1 the card refused it or cannot be reached, 2 wrong use.
)";

struct Options {
  std::string socket;
  bool json = false;
  std::string log;  ///< the options of "log" as the card reads them
  std::vector<std::string> words;
};

int failed(const std::string &error) {
  std::fprintf(stderr, "zarvo_card: %s\n", error.c_str());
  return kFailed;
}

int wrong_use(const std::string &error) {
  std::fprintf(stderr, "zarvo_card: %s; see zarvo_card --help\n", error.c_str());
  return kWrongUse;
}

/// Prints the table of items in Markdown, as the documentation shows it.
int list_items() {
  std::puts("| item | values | what the host sees |\n|---|---|---|");
  for (const virtual_card::ItemText &item : virtual_card::items())
    std::printf("| `%s` | %s | %s |\n", item.usage.c_str(), item.values.c_str(), item.effect.c_str());
  return 0;
}

/// Turns lines "a.b value" into {"a": {"b": value}}.
nlohmann::json as_json(const std::string &report) {
  nlohmann::json document;
  std::istringstream lines(report);
  for (std::string line; std::getline(lines, line);) {
    const auto blank = line.find(' ');
    std::string pointer = "/" + line.substr(0, blank);
    for (char &letter : pointer)
      if (letter == '.') letter = '/';
    const std::string value = line.substr(blank + 1);
    nlohmann::json &place = document[nlohmann::json::json_pointer(pointer)];
    if (value == "yes" || value == "no")
      place = value == "yes";
    else if (!value.empty() && value.find_first_not_of("0123456789") == std::string::npos)
      place = std::stoull(value);
    else
      place = value;
  }
  return document;
}

int show_report(const Options &options) {
  std::string report;
  const std::string error =
      card::ask(options.socket, options.words[0], [&](const std::string &piece) { report += piece; });
  if (!error.empty()) return failed(error);
  std::cout << (options.json ? as_json(report).dump(2) + "\n" : report);
  return 0;
}

int follow_log(const Options &options) {
  const std::string error = card::ask(options.socket, "log" + options.log, [](const std::string &piece) {
    std::cout << piece << std::flush;
    if (!std::cout) std::exit(0);  // the reader has gone away
  });
  return error.empty() ? 0 : failed(error);
}

int save_snapshot(const Options &options) {
  if (options.words.size() != 3) return wrong_use("snapshot needs a channel and a file");
  const std::string &path = options.words[2];
  const bool png = path.ends_with(".png");
  if (!png && !path.ends_with(".ppm")) return wrong_use("the file's name ends in neither .png nor .ppm");
  std::string ppm;
  const std::string error = card::ask(options.socket, "snapshot " + options.words[1],
                                      [&](const std::string &piece) { ppm += piece; });
  if (!error.empty()) return failed(error);
  const bool saved = png ? card::write_png(ppm, path)
                         : static_cast<bool>((std::ofstream(path, std::ios::binary) << ppm).flush());
  return saved ? 0 : failed("cannot write " + path);
}

int apply_items(const Options &options) {
  std::string line;
  for (const std::string &item : options.words) line += (line.empty() ? "" : ";") + item;
  const std::string error = card::ask(options.socket, "apply " + line, [](const std::string &) {});
  return error.empty() ? 0 : failed(error);
}

}  // namespace

int main(int count, char **arguments) try {
  constexpr option kOptions[] = {
      {"socket", required_argument, nullptr, 's'}, {"list", no_argument, nullptr, 'l'},
      {"json", no_argument, nullptr, 'j'},         {"only", required_argument, nullptr, 'o'},
      {"no-reads", no_argument, nullptr, 'n'},     COMMON_OPTIONS};
  Options options;
  if (const char *socket = std::getenv("ZARVO_CARD_SOCKET")) options.socket = socket;
  for (int letter; (letter = next_option(count, arguments, kOptions, kUsage, &options.words)) >= 0;) {
    switch (letter) {
      case 's':
        options.socket = optarg;
        break;
      case 'j':
        options.json = true;
        break;
      case 'o':
        options.log += std::string(" only=") + optarg;
        break;
      case 'n':
        options.log += " no-reads";
        break;
      default:
        return list_items();
    }
  }
  if (options.words.empty()) return wrong_use("no item given");
  if (options.socket.empty()) return wrong_use("no socket given: use --socket or ZARVO_CARD_SOCKET");
  const std::string &word = options.words[0];
  if (word == "snapshot") return save_snapshot(options);
  if (word != "state" && word != "counters" && word != "log") return apply_items(options);
  if (options.words.size() > 1) return wrong_use("\"" + word + "\" takes no arguments");
  return word == "log" ? follow_log(options) : show_report(options);
} catch (const UsageError &error) {
  return wrong_use(error.what());
}

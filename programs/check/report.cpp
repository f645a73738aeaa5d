// Prints the list of checks and what they find.
#include "report.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <nlohmann/json.hpp>

namespace contract {
namespace {

constexpr const char *kOutcomes[] = {"held", "broken", "skipped"};

/// A JSON text is also a YAML text.
std::string quoted(const std::string &text) {
  return nlohmann::json(text).dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

}  // namespace

void print_list(const Checks &checks) {
  std::puts("| check | what it proves | `--quick` |\n|---|---|---|");
  for (const Check &check : checks)
    std::printf("| `%s` | %s | %s |\n", check.name.c_str(), check.proves.c_str(), check.quick ? "yes" : "");
}

Report::Report(std::FILE *out, bool json, std::size_t checks)
    : out_(out),
      json_(json),
      terminal_(isatty(STDERR_FILENO) != 0),
      checks_(checks),
      document_(std::make_unique<nlohmann::json>(nlohmann::json{{"checks", nlohmann::json::array()}})) {
  // The prove of Debian 12 refuses version 14. The report uses nothing that version 13 lacks.
  const int version = std::getenv("HARNESS_ACTIVE") != nullptr ? 13 : 14;
  if (!json_) std::fprintf(out_, "TAP version %d\n1..%zu\n", version, checks);
}

Report::~Report() = default;

void Report::clear_progress() const {
  if (terminal_) std::fputs("\r\033[K", stderr);
}

void Report::begin(const Check &check) {
  if (!terminal_) return;
  std::fprintf(stderr, "\r\033[K%zu of %zu: %s", number_ + 1, checks_, check.name.c_str());
}

Report::Theme &Report::theme_of(const Check &check) {
  const std::string name = check.name.substr(0, check.name.find('.'));
  const auto known =
      std::find_if(themes_.begin(), themes_.end(), [&](const Theme &theme) { return theme.name == name; });
  return known != themes_.end() ? *known : themes_.emplace_back(Theme{name});
}

void Report::add(const Check &check, const Result &result, double seconds) {
  clear_progress();
  ++number_;
  Theme &theme = theme_of(check);
  ++(result.outcome == Outcome::held     ? theme.held
     : result.outcome == Outcome::broken ? theme.broken
                                         : theme.skipped);
  if (result.outcome == Outcome::broken) ++broken_;
  if (json_) {
    nlohmann::json row{
        {"name", check.name}, {"outcome", kOutcomes[static_cast<int>(result.outcome)]}, {"seconds", seconds}};
    if (result.outcome == Outcome::skipped) row["reason"] = result.got;
    if (result.outcome == Outcome::broken)
      row.update({{"proves", check.proves},
                  {"expected", result.expected},
                  {"got", result.got},
                  {"meaning", check.meaning}});
    (*document_)["checks"].push_back(row);
    return;
  }
  std::fprintf(out_, "%sok %zu - %s", result.outcome == Outcome::broken ? "not " : "", number_,
               check.name.c_str());
  if (result.outcome == Outcome::skipped) std::fprintf(out_, " # SKIP %s", result.got.c_str());
  std::fputc('\n', out_);
  if (result.outcome == Outcome::broken)
    std::fprintf(out_, "  ---\n  proves: %s\n  expected: %s\n  got: %s\n  meaning: %s\n  ...\n",
                 quoted(check.proves).c_str(), quoted(result.expected).c_str(), quoted(result.got).c_str(),
                 quoted(check.meaning).c_str());
  std::fflush(out_);
}

void Report::end(const std::string &bail_out) {
  clear_progress();
  if (json_) {
    for (const Theme &theme : themes_)
      (*document_)["themes"][theme.name] = {
          {"held", theme.held}, {"broken", theme.broken}, {"skipped", theme.skipped}};
    if (!bail_out.empty()) (*document_)["bail_out"] = bail_out;
    std::fprintf(out_, "%s\n",
                 document_->dump(2, ' ', false, nlohmann::json::error_handler_t::replace).c_str());
    std::fflush(out_);
    return;
  }
  for (const Theme &theme : themes_)
    std::fprintf(out_, "# %-12s %3u hold, %u do not, %u skipped\n", theme.name.c_str(), theme.held,
                 theme.broken, theme.skipped);
  if (!bail_out.empty()) std::fprintf(out_, "Bail out! %s\n", bail_out.c_str());
  std::fflush(out_);
}

}  // namespace contract

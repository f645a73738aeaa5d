/**
 * @file check.h
 * What a check is, and what it finds.
 */
#ifndef CONTRACT_CHECK_H
#define CONTRACT_CHECK_H

#include <functional>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "zv_type.h"

namespace contract {

class Bench;

enum class Outcome { held, broken, skipped };

struct Result {
  Outcome outcome;
  std::string expected;
  std::string got;  ///< the reason of a skip
};

inline Result held() {
  return {Outcome::held, {}, {}};
}
inline Result broken(std::string expected, std::string got) {
  return {Outcome::broken, std::move(expected), std::move(got)};
}
inline Result skipped(std::string reason) {
  return {Outcome::skipped, {}, std::move(reason)};
}

/// Joins its arguments to one text.
template <typename... Parts>
std::string words(const Parts &...parts) {
  std::ostringstream text;
  (text << ... << parts);
  return text.str();
}

template <typename... Parts>
Result expect(bool holds, std::string expected, const Parts &...got) {
  return holds ? held() : broken(std::move(expected), words(got...));
}

/// Expects a value from lowest to highest.
inline Result expect_between(const std::string &what, double value, double lowest, double highest) {
  return expect(value >= lowest && value <= highest, words(what, " from ", lowest, " to ", highest), value);
}

struct Check {
  std::string name;  ///< begins with the theme
  std::string proves;
  std::string meaning;  ///< what it means for the user if the check fails
  bool quick;
  std::function<Result(Bench &)> run;
};
using Checks = std::vector<Check>;

/// A row of a theme's table: a check that needs nothing but the card.
struct CheckRow {
  const char *name;  ///< without the theme
  const char *proves;
  const char *meaning;
  Result (*run)(Bench &bench);
};
/// Adds the rows as quick checks.
template <typename Rows>
void add_rows(Checks &checks, const std::string &theme, const Rows &rows) {
  for (const CheckRow &row : rows)
    checks.push_back({theme + "." + row.name, row.proves, row.meaning, true, row.run});
}

/// Returns "ntsc" or "pal".
inline const char *name_of(u32 standard) {
  return standard == VIDEO_STANDARD_ZV_PAL ? "pal" : "ntsc";
}

/// Thrown when the program cannot run at all; what() says why and what to do.
struct CannotRun : std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Thrown between checks and in pauses after a signal has asked the program to end.
struct Interrupted {};

// Each theme adds its checks.
void add_nodes(Checks &checks);
void add_boundary(Checks &checks);
void add_limits(Checks &checks);
void add_registers(Checks &checks);
void add_mpeg4(Checks &checks);
void add_mjpeg(Checks &checks);
void add_audio(Checks &checks);
void add_preview(Checks &checks);
void add_picture(Checks &checks);
void add_motion(Checks &checks);
void add_switches(Checks &checks);
void add_load(Checks &checks);
void add_watchdog(Checks &checks);

}  // namespace contract

#endif

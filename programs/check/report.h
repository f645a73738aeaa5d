/**
 * @file report.h
 * Prints the list of checks and what they find: TAP 14, or one JSON document.
 */
#ifndef CONTRACT_REPORT_H
#define CONTRACT_REPORT_H

#include <cstdio>
#include <memory>
#include <nlohmann/json_fwd.hpp>

#include "check.h"

namespace contract {

/// Prints the checks as a table in Markdown, as the documentation shows it.
void print_list(const Checks &checks);

class Report {
 public:
  Report(std::FILE *out, bool json, std::size_t checks);
  ~Report();
  Report(const Report &) = delete;
  Report &operator=(const Report &) = delete;

  void begin(const Check &check);  ///< shows progress on a terminal
  void add(const Check &check, const Result &result, double seconds);
  /// Ends the report; with a reason if not all checks have run.
  void end(const std::string &bail_out);
  bool all_hold() const { return broken_ == 0; }

 private:
  struct Theme {
    std::string name;
    unsigned held = 0, broken = 0, skipped = 0;
  };
  Theme &theme_of(const Check &check);
  void clear_progress() const;

  std::FILE *out_;
  bool json_;
  bool terminal_;
  std::size_t checks_;
  std::size_t number_ = 0;
  unsigned broken_ = 0;
  std::vector<Theme> themes_;
  std::unique_ptr<nlohmann::json> document_;
};

}  // namespace contract

#endif

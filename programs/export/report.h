/**
 * @file report.h
 * Lines on standard error, and whether they say that the clip lacks something.
 */
#ifndef EXPORT_REPORT_H
#define EXPORT_REPORT_H

#include <cstdio>
#include <string>

namespace clips {

class Report {
 public:
  void note(const std::string &text) { std::fprintf(stderr, "zarvo_export: %s\n", text.c_str()); }
  /// Notes something that the clip lacks.
  void skipped(const std::string &text) {
    note(text);
    complete_ = false;
  }
  bool complete() const { return complete_; }

 private:
  bool complete_ = true;
};

}  // namespace clips

#endif

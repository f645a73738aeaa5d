/**
 * @file output_file.h
 * A file that appears under its name when it is complete.
 */
#ifndef EXPORT_OUTPUT_FILE_H
#define EXPORT_OUTPUT_FILE_H

#include <string>

namespace clips {

class OutputFile {
 public:
  /// Creates NAME.part. Throws std::runtime_error if that or NAME exists and `force` is false.
  OutputFile(const std::string &name, bool force);
  /// Removes NAME.part unless commit() has been called.
  ~OutputFile();
  OutputFile(const OutputFile &) = delete;
  OutputFile &operator=(const OutputFile &) = delete;

  const std::string &path() const { return path_; }
  void commit();

 private:
  std::string name_, path_;
  bool done_ = false;
};

}  // namespace clips

#endif

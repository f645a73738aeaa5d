// Creates a file under a preliminary name.
#include "output_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <stdexcept>

namespace clips {

OutputFile::OutputFile(const std::string &name, bool force) : name_(name), path_(name + ".part") {
  for (const std::string &path : {name_, path_})
    if (!force && exists(std::filesystem::symlink_status(path)))
      throw std::runtime_error(path + " exists; --force overwrites it");
  if (force) unlink(path_.c_str());
  const int file = open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
  if (file < 0) throw std::runtime_error(path_ + ": " + std::strerror(errno));
  close(file);
}

OutputFile::~OutputFile() {
  if (!done_) unlink(path_.c_str());
}

void OutputFile::commit() {
  if (std::rename(path_.c_str(), name_.c_str()) != 0)
    throw std::runtime_error(name_ + ": " + std::strerror(errno));
  done_ = true;
}

}  // namespace clips

/**
 * @file service.h
 * What makes the program a service: it reports its state to systemd, and a lock allows only one recorder in
 * each root.
 */
#ifndef RECORDER_SERVICE_H
#define RECORDER_SERVICE_H

#include <string>

namespace recorder {

/// Sends lines such as "READY=1" to the service manager, if there is one. Does not wait for it.
void notify(const std::string &lines);

/// Holds a root for this process as long as it lives. The lock file stays; a lock ends with its process.
class RootLock {
 public:
  /// Throws std::runtime_error if another recorder holds the root, or the root cannot be written.
  explicit RootLock(const std::string &root);
  ~RootLock();
  RootLock(const RootLock &) = delete;
  RootLock &operator=(const RootLock &) = delete;

 private:
  int file_;
};

}  // namespace recorder

#endif

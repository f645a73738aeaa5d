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

/// Holds a root for this recorder. The lock file stays; a lock ends with its process.
class RootLock {
 public:
  /// Throws std::runtime_error if another recorder holds the root, or the root cannot be written.
  explicit RootLock(const std::string &root);
  ~RootLock();

  /// Takes the lock again if the root, or the lock file in it, is no longer the one that was locked. Returns
  /// 0 or an errno: EWOULDBLOCK if another recorder holds it.
  int hold();

  RootLock(const RootLock &) = delete;
  RootLock &operator=(const RootLock &) = delete;

 private:
  const std::string path_;
  int file_ = -1;
};

}  // namespace recorder

#endif

/**
 * @file lazy.h
 * A value that several checks share. The first check that needs it makes it.
 */
#ifndef CONTRACT_LAZY_H
#define CONTRACT_LAZY_H

#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

namespace contract {

template <typename Value>
class Lazy {
 public:
  /// If `make` has failed once, fails again in the same way without another attempt.
  template <typename Make>
  const Value &get(Make make) {
    if (value_) return *value_;
    if (!failure_.empty()) throw std::runtime_error(failure_);
    try {
      return value_.emplace(make());
    } catch (const std::runtime_error &error) {
      failure_ = error.what();
      throw;
    }
  }

 private:
  std::optional<Value> value_;
  std::string failure_;
};

}  // namespace contract

#endif

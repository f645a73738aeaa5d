/**
 * @file support.h
 * What every folder of tests needs: waiting for a condition, what an action prints, open descriptors.
 */
#ifndef TESTS_SUPPORT_H
#define TESTS_SUPPORT_H

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <iterator>
#include <string>
#include <thread>

namespace virtual_card {}
/// The one short name of the virtual card in the tests.
namespace card = virtual_card;

/// Waits for a condition, half a minute at most: a time that only a fault can use up.
template <typename Condition>
bool eventually(Condition condition) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  while (!condition()) {
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return true;
}

/// Returns how many descriptors this process has open.
inline std::ptrdiff_t open_files() {
  return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

/// What `action` and the threads that end within it print.
template <typename Action>
std::string printed_by(Action action) {
  testing::internal::CaptureStdout();
  action();
  return testing::internal::GetCapturedStdout();
}

#endif

/**
 * @file threads.h
 * Starts the card's threads.
 */
#ifndef VIRTUAL_CARD_THREADS_H
#define VIRTUAL_CARD_THREADS_H

#include <functional>
#include <thread>

namespace virtual_card {

/// Starts a thread that blocks all signals except those that its own errors raise (SIGSEGV, SIGBUS, SIGFPE,
/// SIGILL, SIGTRAP) and runs with normal scheduling even if the caller is a real-time thread. Throws
/// std::system_error when no thread can be created.
std::thread start_thread(std::function<void()> work);

}  // namespace virtual_card

#endif

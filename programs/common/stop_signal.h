/**
 * @file stop_signal.h
 * Lets a signal ask the program to end; the program ends at a moment that it chooses.
 */
#ifndef STOP_SIGNAL_H
#define STOP_SIGNAL_H

#include <atomic>

/// Whether a signal has asked the program to end. The program may set it too.
extern std::atomic<bool> stopping;

/// After this call a SIGHUP, SIGINT or SIGTERM sets `stopping`; the same signal again ends the program, in
/// case the card hangs. Before this call, while the card is being opened, the first signal ends the program.
/// A signal that the caller ignores, as nohup does, stays ignored.
void catch_stop_signals();

/// After this call a full file and a reader that has gone are errors of a write, not the end of the program.
void survive_write_errors();

#endif

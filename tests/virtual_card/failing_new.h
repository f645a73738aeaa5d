/**
 * @file failing_new.h
 * Lets one allocation with operator new fail.
 */
#ifndef FAILING_NEW_H
#define FAILING_NEW_H

#include <atomic>

/// At 0 the next allocation fails, once; negative: none fails.
extern std::atomic<long> allocations_left;

#endif

/**
 * @file zv_bits.h
 * Helpers for register values, and a delay that does not sleep.
 *
 * Context of all: any thread, any state. The bit helpers never fail and never block.
 */
#ifndef ZV_BITS_H
#define ZV_BITS_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Clears bits.
 *
 * @param value  a register's content
 * @param mask   the bits to clear
 * @return @p value with the bits of @p mask cleared
 *
 * Context: any thread; any state. Does not block.
 */
u32 mask_bit(u32 value, u32 mask);

/**
 * Picks bits out.
 *
 * @param value  a register's content
 * @param mask   the bits to keep
 * @return the bits of @p value that @p mask has
 *
 * Context: any thread; any state. Does not block.
 */
u32 get_bit(u32 value, u32 mask);

/**
 * Sets bits.
 *
 * @param value  a register's content
 * @param mask   the bits to set
 * @return @p value with the bits of @p mask set
 *
 * Context: any thread; any state. Does not block.
 */
u32 set_bit(u32 value, u32 mask);

/**
 * Puts bits back.
 *
 * @param value  a register's content
 * @param mask   the bits to replace
 * @param saved  what get_bit() gave for @p mask earlier; other bits of it must be 0
 * @return @p value with the bits of @p mask taken from @p saved
 *
 * Context: any thread; any state. Does not block.
 */
u32 restore_bit(u32 value, u32 mask, u32 saved);

/**
 * Busy-waits.
 *
 * @param us  microseconds of wall-clock time that pass at least
 *
 * Context: any thread; any state. Does not sleep: the caller keeps its processor all the time.
 */
void zv_delay(u32 us);

#ifdef __cplusplus
}
#endif

#endif

/**
 * @file zv_bits.h
 * Helpers for the bits of register values, and a delay that does not sleep. They need no open card and
 * never fail.
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
 * Keeps some bits.
 *
 * @param value  a register's content
 * @param mask   the bits to keep
 * @return @p value with all bits outside @p mask cleared
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
 * Puts saved bits back.
 *
 * @param value  a register's content
 * @param mask   the bits to replace
 * @param saved  an earlier result of get_bit() for @p mask; its other bits must be 0
 * @return @p value with the bits of @p mask taken from @p saved
 *
 * Context: any thread; any state. Does not block.
 */
u32 restore_bit(u32 value, u32 mask, u32 saved);

/**
 * Busy-waits: runs in a loop until the time has passed.
 *
 * @param us  the shortest wait, in microseconds of wall-clock time
 *
 * Context: any thread; any state. Blocks for @p us microseconds without sleeping.
 */
void zv_delay(u32 us);

#ifdef __cplusplus
}
#endif

#endif

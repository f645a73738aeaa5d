#ifndef ZV_BITS_H
#define ZV_BITS_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

u32 mask_bit(u32 value, u32 mask);
u32 get_bit(u32, u32);
u32 set_bit(u32, u32);
u32 restore_bit(u32 value, u32 mask, u32 saved);
void zv_delay(u32 us);

#ifdef __cplusplus
}
#endif

#endif

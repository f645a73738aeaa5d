/**
 * @file preload.h
 * Removes this library from LD_PRELOAD.
 */
#ifndef VIRTUAL_CARD_PRELOAD_H
#define VIRTUAL_CARD_PRELOAD_H

namespace virtual_card {

/// Removes this library from LD_PRELOAD: the programs that the host starts do not inherit it.
void leave_preload_list();

}  // namespace virtual_card

#endif

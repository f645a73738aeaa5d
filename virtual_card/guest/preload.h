/**
 * @file preload.h
 * Removes this library from LD_PRELOAD.
 */
#ifndef VIRTUAL_CARD_PRELOAD_H
#define VIRTUAL_CARD_PRELOAD_H

namespace virtual_card {

/// Removes this library from LD_PRELOAD: the programs that the host starts from now on do not inherit it.
/// Call it when the first node is opened: until then the list passes through wrappers such as nice or a
/// shell.
void leave_preload_list();

}  // namespace virtual_card

#endif

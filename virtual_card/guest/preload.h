#ifndef VIRTUAL_CARD_PRELOAD_H
#define VIRTUAL_CARD_PRELOAD_H

namespace virtual_card {

/// Takes this library out of LD_PRELOAD, so that programs this one starts do not inherit it.
void leave_preload_list();

}  // namespace virtual_card

#endif

#ifndef VIRTUAL_CARD_CARD_THREAD_H
#define VIRTUAL_CARD_CARD_THREAD_H

#include <functional>
#include <thread>

namespace virtual_card {

/// Starts a thread that takes none of the host's signals, but for those of a fault of its own, and
/// nothing of the starter's real-time scheduling. Throws std::system_error when there is none to be had.
std::thread start_thread(std::function<void()> work);

}  // namespace virtual_card

#endif

/**
 * @file user_memory.h
 * Copies between the card and addresses from the host, which may be wrong: the kernel does the copy and
 * reports a bad address. Results are 0 or a negated error number.
 */
#ifndef VIRTUAL_CARD_USER_MEMORY_H
#define VIRTUAL_CARD_USER_MEMORY_H

#include <cstddef>
#include <cstdint>

namespace virtual_card {

long copy_from_user(void *to, std::uintptr_t from, std::size_t size);
long copy_to_user(std::uintptr_t to, const void *from, std::size_t size);

}  // namespace virtual_card

#endif

/**
 * @file descriptors.h
 * Which descriptors and mappings of the process belong to the card. A descriptor that does not is recognised
 * with one atomic load. In a process that shares this memory without being this process, like the child of a
 * vfork, no descriptor counts as the card's.
 */
#ifndef VIRTUAL_CARD_DESCRIPTORS_H
#define VIRTUAL_CARD_DESCRIPTORS_H

#include <cstddef>
#include <optional>

#include "virtual_card.h"

namespace virtual_card::descriptors {

/// Descriptors with higher numbers cannot be the card's.
inline constexpr std::size_t kTableSize = 65536;

/// What a descriptor number stands for.
struct Owner {
  bool ours = false;
  /// Device::none: a descriptor inherited through fork. Its card stayed with the parent.
  Device device = Device::none;
};
Owner owner(int fd);
/// Whether the calling process is the one that the card is in.
bool at_home();
/// Makes the calling process the card's.
void settle();

/// False when the number is beyond the table.
bool add(int fd, Device device);
/// Removes a number; returns what it stood for.
Owner remove(int fd);
/// A descriptor of the device, or -1.
int find(Device device);

void add_mapping(void *address, std::size_t length, Device device);
/// The device whose region lies in this range, if any.
std::optional<Device> mapping(const void *address, std::size_t length);
/// Removes the mappings that lie wholly in this range; returns how many.
int remove_mappings(const void *address, std::size_t length);

/// Fork: the lock is held across it. In the child, all descriptors lose their card.
void before_fork();
void after_fork(bool child);

}  // namespace virtual_card::descriptors

#endif

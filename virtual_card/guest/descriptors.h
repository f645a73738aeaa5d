/**
 * @file descriptors.h
 * The tables of descriptors and mappings of this process that belong to the card. A descriptor that is not
 * the card's is recognised with one atomic load. In a vfork child, which shares this memory, no descriptor
 * counts as the card's.
 */
#ifndef VIRTUAL_CARD_DESCRIPTORS_H
#define VIRTUAL_CARD_DESCRIPTORS_H

#include <cstddef>
#include <optional>

#include "virtual_card.h"

namespace virtual_card::descriptors {

/// Number of entries in the descriptor table. Descriptors from this number on cannot be the card's.
inline constexpr std::size_t kTableSize = 65536;

/// Tells whether a descriptor is the card's, and of which device.
struct Owner {
  bool ours = false;
  /// Device::none for a descriptor inherited through fork: its card stayed in the parent.
  Device device = Device::none;
};
Owner owner(int fd);
/// Returns whether the calling process is the one that the card belongs to.
bool at_home();
/// Makes the calling process the one that the card belongs to.
void settle();

/// Adds a descriptor. Returns false when its number is too high for the table.
bool add(int fd, Device device);
/// Removes a descriptor and returns its entry.
Owner remove(int fd);
/// Returns an open descriptor of the device, or -1.
int find(Device device);

/// Adds a mapping. Returns false when memory runs out.
bool add_mapping(void *address, std::size_t length, Device device);
/// Returns the device of a mapping that overlaps this range, if there is one.
std::optional<Device> mapping(const void *address, std::size_t length);
/// Removes the mappings that lie completely in this range. Returns their number.
int remove_mappings(const void *address, std::size_t length);

/// Call these around fork(): the lock is held during it. In the child, all descriptors lose their card.
void before_fork();
void after_fork(bool child);

}  // namespace virtual_card::descriptors

#endif

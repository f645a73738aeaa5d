/**
 * @file descriptors.h
 * Which descriptors of the process are the card's, and which mappings. Telling that one is not costs
 * one atomic load.
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
  /// Device::none: a descriptor that came through a fork. Its card stayed with the parent.
  Device device = Device::none;
};
Owner owner(int fd);

/// False when the number is beyond the table.
bool add(int fd, Device device);
/// Forgets a number; what it stood for.
Owner remove(int fd);
/// Descriptors that reach the card.
int count();

void add_mapping(void *address, std::size_t length, Device device);
/// The device whose region lies in this range, if any.
std::optional<Device> mapping(const void *address, std::size_t length);
/// Forgets the mappings that lie wholly in this range; how many.
int remove_mappings(const void *address, std::size_t length);
int mappings();

/// Fork: the lock is held across it. In the child, all descriptors lose their card.
void before_fork();
void after_fork(bool child);

}  // namespace virtual_card::descriptors

#endif

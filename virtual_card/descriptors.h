/**
 * @file descriptors.h
 * Which descriptors of the process are the card's, and which mappings. Telling that one is not costs
 * one atomic load. In a process that shares this memory without being this process, as the child of a
 * vfork is, none of them is.
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
  /// The card's own, which the host neither has nor may close. Not `ours` to answer for.
  bool inner = false;
};
Owner owner(int fd);
/// This process is the one the card is in.
bool at_home();
/// From now on it is this one.
void settle();

/// False when the number is beyond the table.
bool add(int fd, Device device);
/// The same for a descriptor of the card's own.
bool add_inner(int fd);
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

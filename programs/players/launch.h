/**
 * @file launch.h
 * What both players have in common: opening a recording and handing it to an installed player.
 */
#ifndef LAUNCH_H
#define LAUNCH_H

#include <sys/types.h>

#include <string>
#include <vector>

namespace players {

/// A player to hand a recording to, with its arguments.
struct PlayerCommand {
  std::string program;
  std::vector<std::string> arguments;
};

/// Opens the one FILE argument of a player for reading. -1 when it is no file with more than `header` bytes;
/// the reason or the usage stands on standard error then.
int open_argument(int argc, char **argv, off_t header);

/// The last part of a path.
std::string base_name(const std::string &path);

/// Replaces this process by the first of the players that is installed; all descriptors but the standard ones
/// are closed. Returns 1, with a message on standard error, when no player can be run.
int hand_over(const std::vector<PlayerCommand> &commands);

}  // namespace players

#endif

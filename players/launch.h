/**
 * @file launch.h
 * What both players have in common: opening a recording and handing it to an installed player.
 */
#ifndef LAUNCH_H
#define LAUNCH_H

#include <string>
#include <vector>

namespace players {

/// A player to hand a recording to, with its arguments. It reads the stream from standard input.
struct Command {
  std::string program;
  std::vector<std::string> arguments;
};

/// Opens the one FILE argument of a player for reading. On failure -1, and the reason or the usage stands
/// on standard error.
int open_argument(int argc, char **argv);

/// The last part of a path.
std::string base_name(const std::string &path);

/// Replaces this process by the first of the players that is installed, `file` being its standard input
/// from its current position on; all other descriptors but standard output and error are closed. Returns 1,
/// with a message on standard error, when nothing is left to read or no player can be run. `path` is the
/// file's name for the message.
int hand_over(int file, const char *path, const std::vector<Command> &commands);

}  // namespace players

#endif

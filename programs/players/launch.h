/**
 * @file launch.h
 * Functions that both players use: open a recording and start an installed player.
 */
#ifndef LAUNCH_H
#define LAUNCH_H

#include <sys/types.h>

#include <string>
#include <vector>

namespace players {

/// A player program and its arguments.
struct PlayerCommand {
  std::string program;
  std::vector<std::string> arguments;
};

/// Opens the only argument, FILE, for reading. Returns the descriptor. If FILE is not a regular file with
/// more than `header` bytes, prints the reason or the usage on standard error and returns -1. For an option,
/// ends the program: with status 0 after the text for --help, -h or --version, else with status 2.
int open_argument(int argc, char **argv, off_t header);

/// Returns the last part of a path.
std::string base_name(const std::string &path);

/// Closes all descriptors but the standard ones and replaces this process by the first of the players that is
/// installed. If none can be run, prints a message on standard error and returns 1.
int run_first_installed(const std::vector<PlayerCommand> &commands);

}  // namespace players

#endif

// Opens a recording and starts an installed player.
#include "launch.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "programs/common/command_line.h"

namespace players {
namespace {

/// Replaces this process by a program. Returns only when that fails; errno then holds the reason.
void run(const PlayerCommand &command) {
  std::vector<char *> argv = {const_cast<char *>(command.program.c_str())};
  for (const std::string &argument : command.arguments) argv.push_back(const_cast<char *>(argument.c_str()));
  argv.push_back(nullptr);
  execvp(argv[0], argv.data());
}

/// Ends the program as the option in front says; with status 2 for an option that it does not have.
[[noreturn]] void end_with_option(int argc, char **argv) {
  const std::string program = program_invocation_short_name;
  const std::string help = "Usage: " + program +
                           " FILE\n"
                           "Plays a recording with ffplay, or with mpv if ffplay is not installed.\n\n"
                           "  -h, --help   this text\n"
                           "  --version    the version\n";
  constexpr option kOptions[] = {COMMON_OPTIONS};
  try {
    next_option(argc, argv, kOptions, help.c_str());
  } catch (const UsageError &) {
  }
  std::fprintf(stderr, "%s: '%s' is neither an option nor a file\n%s", program.c_str(), argv[1],
               help.c_str());
  std::exit(2);
}

}  // namespace

int open_argument(int argc, char **argv, off_t header) {
  if (argc > 1 && *argv[1] == '-' && access(argv[1], F_OK) != 0) end_with_option(argc, argv);
  if (argc != 2) {
    std::fprintf(stderr, "Usage: %s FILE\n", argc > 0 ? argv[0] : "player");
    return -1;
  }
  const int file = open(argv[1], O_RDONLY | O_NONBLOCK);
  struct stat info {};
  const char *reason = nullptr;
  if (file < 0 || fstat(file, &info) != 0) {
    reason = std::strerror(errno);
  } else if (!S_ISREG(info.st_mode)) {
    reason = "not a recording";
  } else if (info.st_size <= header) {
    reason = "nothing is recorded in this file";
  }
  if (!reason) return file;
  std::fprintf(stderr, "%s: %s\n", argv[1], reason);
  if (file >= 0) close(file);
  return -1;
}

std::string base_name(const std::string &path) {
  return path.substr(path.rfind('/') + 1);
}

int run_first_installed(const std::vector<PlayerCommand> &commands) {
  // Do not pass on descriptors of the program that started this one, for example those of the card.
  closefrom(STDERR_FILENO + 1);
  bool installed = false;
  for (const PlayerCommand &command : commands) {
    run(command);
    if (errno == ENOENT) continue;
    installed = true;
    std::fprintf(stderr, "%s: %s\n", command.program.c_str(), std::strerror(errno));
  }
  if (!installed) std::fputs("No player found. Install ffplay (package ffmpeg) or mpv.\n", stderr);
  return 1;
}

}  // namespace players

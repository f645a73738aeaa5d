// Theme nodes: opening, closing and opening again.
#include <fcntl.h>
#include <unistd.h>

#include <cerrno>

#include "bench.h"
#include "check.h"

namespace contract {
namespace {

int try_open(unsigned node) {
  return open(kNodePaths[node], O_RDWR | O_CLOEXEC);
}

Result opens(unsigned node) {
  const int fd = try_open(node);
  if (fd < 0) return broken("open succeeds", error_name(errno));
  if (close(fd) != 0) return broken("close succeeds", error_name(errno));
  return held();
}

Result second_open(unsigned node) {
  const int first = try_open(node);
  const int second = try_open(node);
  const int error = second < 0 ? errno : 0;
  for (const int fd : {first, second})
    if (fd >= 0) close(fd);
  return expect(first >= 0 && (error == 0 || error == EBUSY), "success or EBUSY", error_name(error));
}

Result reopens(unsigned node) {
  constexpr int kTimes = 10;
  for (int time = 1; time <= kTimes; ++time)
    if (const Result result = opens(node); result.outcome != Outcome::held)
      return broken(words(kTimes, " times open and close"), words(result.got, " at time ", time));
  return held();
}

/// Whether the driver answers on a descriptor. The audio node has no command that it could answer.
bool answers(unsigned node, int fd) {
  driver::ChannelValue scale{};
  driver::Register reg{driver::kRegRouting, 0};
  u32 width = 0;
  switch (node) {
    case kEncoder:
      return issue(fd, driver::ENC_IOC_GET_SCALE, &scale) == 0;
    case kDisplay:
      return issue(fd, driver::DISP_IOC_GET_WIDTH, &width) == 0;
    case kVideoInput:
      return issue(fd, driver::VIN_IOC_READ_REG, &reg) == 0;
    default:
      return fcntl(fd, F_GETFD) >= 0;
  }
}

Result first_close(unsigned node) {
  const int first = try_open(node);
  const int second = try_open(node);
  if (first >= 0) close(first);
  if (second < 0) return skipped("the driver lets a node be open once only");
  const bool served = answers(node, second);
  close(second);
  return expect(served, "the second descriptor still answers", "it does not");
}

Result read_only_open(unsigned node) {
  const int fd = open(kNodePaths[node], O_RDONLY | O_CLOEXEC);
  if (fd < 0) return broken("open for reading succeeds where reading and writing does", error_name(errno));
  close(fd);
  return held();
}

struct Row {
  const char *name;
  const char *proves;
  const char *meaning;
  Result (*run)(unsigned node);
};
constexpr Row kRows[] = {
    {"opens", "The node opens and closes.", "No program can use the card.", opens},
    {"second-open", "A second open works or says EBUSY.",
     "A second program hangs or breaks the first instead of saying that the card is in use.", second_open},
    {"first-close", "Closing one descriptor leaves another one open.",
     "A program that ends takes the card away from another one.", first_close},
    {"reopens", "The node opens and closes ten times in a row.",
     "After some programs have used it, the card needs a restart of the machine.", reopens},
    {"permission", "Whoever may read and write the node may open it for reading.",
     "The permissions of the node contradict each other.", read_only_open},
};

Result reopens_all(Bench &bench) {
  bench.close_all();
  for (int time = 0; time < 10; ++time) Nodes nodes;
  return held();
}

Result sdk_reopens(Bench &bench) {
  bench.close_all();
  for (int time = 1; time <= 10; ++time) {
    HANDLE handle = nullptr;
    if (const int status = zv_Open(&handle); status != ZV_OK)
      return broken("zv_Open succeeds ten times", words("status ", status, " at time ", time));
    if (const int status = zv_Close(handle); status != ZV_OK) {
      zv_Close(handle);
      return broken("zv_Close succeeds ten times", words("status ", status, " at time ", time));
    }
  }
  return held();
}

}  // namespace

void add_nodes(Checks &checks) {
  for (unsigned node = 0; node < kNodes; ++node)
    for (const Row &row : kRows)
      checks.push_back({words("nodes.", kNodeNames[node], ".", row.name), row.proves, row.meaning, true,
                        [node, run = row.run](Bench &bench) {
                          bench.close_all();
                          return run(node);
                        }});
  checks.push_back({"nodes.all.reopen", "All four nodes together open and close ten times.",
                    "Programs cannot follow each other.", true, reopens_all});
  checks.push_back({"nodes.sdk.reopens", "The SDK opens and closes the card ten times.",
                    "Programs cannot follow each other.", true, sdk_reopens});
}

}  // namespace contract

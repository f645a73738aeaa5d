// The nodes when memory runs out.

#include <sys/wait.h>

#include "failing_new.h"
#include "node_test.h"

namespace {

constexpr int kHeld = 10, kNoneFailed = 11;

/// Uses a new card while one allocation fails. Calls may fail, and the card must be usable afterwards.
int use_card_while_failing(long failing) {
  allocations_left = failing;
  const int first = open(driver::kEncoderNode, O_RDWR);
  if (first >= 0) {
    void *region = mmap(nullptr, driver::kStreamRegionSize, PROT_READ, MAP_SHARED, first, 0);
    if (region != MAP_FAILED) munmap(region, driver::kStreamRegionSize);
    ioctl(first, driver::ENC_IOC_START);
    read_node(first, nullptr, driver::kMpeg4ReadSize);
    close(first);
  }
  try {
    card::apply("lost=3; @5-8 stall=mpeg4; fail=audio/read:EIO:1; bits=mpeg4:3");
  } catch (const std::bad_alloc &) {
  }
  const bool failed = allocations_left.exchange(-1) < 0;
  const int second = open(driver::kVideoInputNode, O_RDWR);
  driver::Register record{driver::kRegRouting, 0};
  const bool works = second >= 0 && ioctl(second, driver::VIN_IOC_READ_REG, &record) == 0;
  return !works ? EXIT_FAILURE : failed ? kHeld : kNoneFailed;
}

// Catches: a card that ends the program, or never opens again, when memory runs out. Each child of a fork
// powers up a card of its own.
TEST(NodeMemory, AFailedAllocationFailsACallAndHoldsNothingBack) {
#ifdef __SANITIZE_THREAD__
  GTEST_SKIP() << "ThreadSanitizer does not follow a child of fork that starts threads";
#endif
  int code = kHeld;
  for (long failing = 0; code == kHeld; ++failing) {
    const pid_t child = fork();
    if (child == 0) _exit(use_card_while_failing(failing));
    int status = 0;
    waitpid(child, &status, 0);
    ASSERT_TRUE(WIFEXITED(status)) << "signal " << WTERMSIG(status) << " at allocation " << failing;
    code = WEXITSTATUS(status);
    ASSERT_NE(code, EXIT_FAILURE) << "allocation " << failing;
  }
  EXPECT_EQ(code, kNoneFailed);
}

}  // namespace

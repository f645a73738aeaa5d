// The library as a guest in a program: which calls it takes, which it leaves alone, and how.

#include <sys/stat.h>
#include <sys/wait.h>

#include <cstring>

#include "node_test.h"

extern "C" {
int __open_2(const char *path, int flags);
int __open64_2(const char *path, int flags);
int __openat_2(int directory, const char *path, int flags);
int __openat64_2(int directory, const char *path, int flags);
ssize_t __read_chk(int fd, void *buffer, size_t count, size_t buffer_size);
}

namespace {

constexpr int kUntouched = 4242;  // no call sets errno to this

/// A file that is none of the card's.
struct OrdinaryFile {
  OrdinaryFile() { EXPECT_EQ(write(fd, "ordinary", 8), 8); }
  ~OrdinaryFile() {
    close(fd);
    unlink(path.c_str());
  }
  const std::string path = testing::TempDir() + "card_guest_" + std::to_string(getpid());
  const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_TRUNC, 0640);
};
std::string content(int fd) {
  char text[8] = {};
  return {text, static_cast<std::size_t>(std::max<ssize_t>(0, pread(fd, text, sizeof text, 0)))};
}

// Catches: a spelling that opens a real node, one that keeps the host from its files.
TEST_F(NodeTest, EverySpellingOfOpenReachesTheCardOrTheFile) {
  using Open = int (*)(const char *path, int flags);
  const std::pair<const char *, Open> spellings[] = {
      {"open", [](auto path, int flags) { return open(path, flags, 0640); }},
      {"open64", [](auto path, int flags) { return open64(path, flags, 0640); }},
      {"openat", [](auto path, int flags) { return openat(AT_FDCWD, path, flags, 0640); }},
      {"openat64", [](auto path, int flags) { return openat64(AT_FDCWD, path, flags, 0640); }},
      {"__open_2", [](auto path, int flags) { return __open_2(path, flags); }},
      {"__open64_2", [](auto path, int flags) { return __open64_2(path, flags); }},
      {"__openat_2", [](auto path, int flags) { return __openat_2(AT_FDCWD, path, flags); }},
      {"__openat64_2", [](auto path, int flags) { return __openat64_2(AT_FDCWD, path, flags); }},
  };
  const OrdinaryFile file;
  for (const auto &[name, spelled] : spellings) {
    SCOPED_TRACE(name);
    errno = kUntouched;
    const int node = spelled(driver::kEncoderNode, O_RDWR);
    EXPECT_EQ(card::open_descriptors(), 5);
    EXPECT_EQ(fcntl(node, F_GETFD), 0) << "closes on exec without O_CLOEXEC";
    EXPECT_EQ(close(node), 0);
    EXPECT_EQ(card::open_descriptors(), 4);
    const int ordinary = spelled(file.path.c_str(), O_RDONLY);
    EXPECT_EQ(content(ordinary), "ordinary");
    EXPECT_EQ(close(ordinary), 0);
    EXPECT_EQ(errno, kUntouched);
    for (const char *absent : {"/nowhere/at/all", driver::kDecoderNode, "/dev/zarvo_enc1", "/dev/zarvo_"})
      EXPECT_EQ(answer(spelled(absent, O_RDWR)), -ENOENT) << absent;
  }
}

TEST_F(NodeTest, OtherCallsPassThroughUntouched) {
  const OrdinaryFile file;
  struct stat status {};
  ASSERT_EQ(fstat(file.fd, &status), 0);
  EXPECT_EQ(status.st_mode & 0777, 0640u) << "the mode of open() got lost";

  char text[8];
  int bytes = 0;
  lseek(file.fd, 0, SEEK_SET);
  errno = kUntouched;
  EXPECT_EQ(__read_chk(file.fd, text, sizeof text, sizeof text), 8);
  EXPECT_EQ(ioctl(file.fd, FIONREAD, &bytes), 0);
  void *mapped = mmap64(nullptr, 8, PROT_READ, MAP_SHARED, file.fd, 0);
  EXPECT_EQ(std::memcmp(mapped, "ordinary", 8), 0);
  EXPECT_EQ(munmap(mapped, 8), 0);
  EXPECT_EQ(errno, kUntouched);
  EXPECT_EQ(card::open_mappings(), 1) << "the fixture's only";
  for (const long result : {answer(close(-1)), answer(read(-1, text, 1)), answer(dup(-1))})
    EXPECT_EQ(result, -EBADF);
}

TEST_F(NodeTest, ErrnoChangesOnlyOnFailureAndCodesAreCutTo32Bits) {
  u32 width = 0;
  errno = kUntouched;
  EXPECT_EQ(ioctl(display, 0xFFFFFFFF00000000ul | driver::DISP_IOC_GET_WIDTH, &width), 0);
  EXPECT_EQ(width, 720u);
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(munmap(mmap(nullptr, kRegion, PROT_READ, MAP_SHARED, encoder, 0), kRegion), 0);
  EXPECT_EQ(errno, kUntouched);
}

TEST_F(NodeTest, DuplicatesAreNodesToo) {
  int (*const ways[])(int) = {
      [](int fd) { return dup(fd); },
      [](int fd) { return dup2(fd, 200); },
      [](int fd) { return dup3(fd, 200, O_CLOEXEC); },
      [](int fd) { return fcntl(fd, F_DUPFD, 100); },
      [](int fd) { return fcntl(fd, F_DUPFD_CLOEXEC, 100); },
      [](int fd) { return dup2(fd, fd); },
  };
  for (const auto way : ways) {
    const int original = open(driver::kDisplayNode, O_RDWR);
    const int copy = way(original);
    EXPECT_EQ(card::open_descriptors(), copy == original ? 5 : 6);
    if (copy != original) close(original);
    EXPECT_EQ(send(copy, driver::DISP_IOC_GET_WIDTH, 0u), 0);
    EXPECT_EQ(close(copy), 0);
    EXPECT_EQ(card::open_descriptors(), 4);
  }
}

// A number that the card still takes for its own would swallow the calls on somebody else's file.
TEST_F(NodeTest, ANumberThatWasReplacedOrClosedIsNoLongerTheCards) {
  const OrdinaryFile file;
  const int replaced = open(driver::kEncoderNode, O_RDWR);
  ASSERT_EQ(dup2(file.fd, replaced), replaced);
  EXPECT_EQ(content(replaced), "ordinary");
  close(replaced);

  const int closed = fcntl(encoder, F_DUPFD, 500);
  ASSERT_EQ(close_range(500, 600, 0), 0);
  ASSERT_EQ(fcntl(file.fd, F_DUPFD, 500), closed);
  EXPECT_EQ(content(closed), "ordinary");
  closefrom(500);
  EXPECT_EQ(read_node(closed, nullptr, 0), -EBADF);
  EXPECT_EQ(card::open_descriptors(), 4);
}

TEST_F(NodeTest, MappingsFollowTheNodesRules) {
  constexpr int kBoth = PROT_READ | PROT_WRITE;
  const struct {
    int fd;
    std::size_t length;
    int protection, flags;
    off_t offset;
    long result;
  } cases[] = {
      {encoder, kRegion, kBoth, MAP_SHARED, 0, 0},
      {encoder, kRegion + 1, PROT_READ, MAP_SHARED, 0, -EINVAL},
      {encoder, kRegion, PROT_READ, MAP_SHARED, 4096, -EINVAL},
      {encoder, 4096, PROT_READ, MAP_PRIVATE, 0, -EINVAL},
      {display, driver::kPreviewBufferSize, PROT_READ, MAP_SHARED, 0, 0},
      {display, driver::kPreviewBufferSize, kBoth, MAP_SHARED, 0, -EACCES},
      {display, driver::kPreviewBufferSize + 1, PROT_READ, MAP_SHARED, 0, -EINVAL},
      {audio, 4096, PROT_READ, MAP_SHARED, 0, -ENODEV},
      {video_input, 4096, PROT_READ, MAP_SHARED, 0, -ENODEV},
  };
  for (const auto &each : cases) {
    SCOPED_TRACE(&each - cases);
    void *mapped = mmap(nullptr, each.length, each.protection, each.flags, each.fd, each.offset);
    EXPECT_EQ(mapped == MAP_FAILED ? -errno : 0, each.result);
    EXPECT_EQ(card::open_mappings(), mapped == MAP_FAILED ? 1 : 2);
    if (mapped != MAP_FAILED) munmap(mapped, each.length);
    EXPECT_EQ(card::open_mappings(), 1);
  }
}

// Catches: memory that goes with the descriptor it was mapped from, memory that outlives the last close and
// meets the next program.
TEST_F(NodeTest, TheDescriptorsOfANodeShareItsMemory) {
  const int second = open(driver::kEncoderNode, O_RDWR);
  auto *mapped = static_cast<u8 *>(mmap(nullptr, kRegion, PROT_READ | PROT_WRITE, MAP_SHARED, second, 0));
  close(second);
  card::queue_mpeg4({{1, 2, 3}, 64});
  EXPECT_EQ(read_mpeg4(), 64);
  EXPECT_THAT(std::vector<u8>(mapped, mapped + 4), testing::ElementsAre(1, 2, 3, 0));
  close_nodes();
  mapped[0] = 77;  // a mapping outlives the descriptors
  open_nodes();
  EXPECT_EQ(region[0], 0);
  munmap(mapped, kRegion);
}

#if defined(__SANITIZE_THREAD__)
constexpr bool kThreadsAfterFork = false;  // ThreadSanitizer ends a forked child that starts a thread
#else
constexpr bool kThreadsAfterFork = true;
#endif

// Catches: a child that waits for the card's threads, which it does not have; options that do not reach the
// card.
TEST_F(NodeTest, AForkedChildLosesTheCardAndCanOpenItsOwn) {
  const OrdinaryFile file;
  const pid_t child = fork();
  if (child == 0) {
    setenv("ZARVO_VIRTUAL_CARD", "lost=1;silent=2;board=cc", 1);
    bool good = card::open_descriptors() == 0 && send(encoder, driver::ENC_IOC_START) == -ENODEV &&
                read_mpeg4() == -ENODEV && close(encoder) == 0 && answer(close(encoder)) == -EBADF &&
                content(file.fd) == "ordinary";
    if (kThreadsAfterFork) {
      video_input = open(driver::kVideoInputNode, O_RDWR);
      good = good && board_command(driver::kBoardVersion) == 0xCC &&
             card::decoder_register(0, driver::kDecoderStatus) == 0xDE && close(video_input) == 0;
    }
    _exit(good ? 0 : 1);
  }
  int status = -1;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(card::open_descriptors(), 4);
  start();
}

}  // namespace

// The library as a guest in a program: which calls it takes, which it leaves alone, and how.

#include <sys/stat.h>
#include <sys/wait.h>

#include <cstring>
#include <functional>

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

/// A file that is none of the card's, and its first bytes.
constexpr char kOrdinary[] = "/proc/self/exe";
constexpr char kContent[] =
    "\x7F"
    "ELF";
std::string content(int fd) {
  char text[4] = {};
  lseek(fd, 0, SEEK_SET);
  return {text, static_cast<std::size_t>(std::max<ssize_t>(0, read(fd, text, sizeof text)))};
}

// Catches: a spelling that opens a real node, one that keeps the host from its files.
TEST_F(NodeTest, EverySpellingOfOpenReachesTheCardOrTheFile) {
  const auto check = [](const char *name, auto spelled) {
    SCOPED_TRACE(name);
    errno = kUntouched;
    const int node = spelled(driver::kEncoderNode, O_RDWR);
    EXPECT_EQ(card::open_descriptors(), 5);
    EXPECT_EQ(fcntl(node, F_GETFD), 0) << "closes on exec without O_CLOEXEC";
    EXPECT_EQ(close(node), 0);
    EXPECT_EQ(card::open_descriptors(), 4);
    const int ordinary = spelled(kOrdinary, O_RDONLY);
    EXPECT_EQ(content(ordinary), kContent);
    EXPECT_EQ(close(ordinary), 0);
    EXPECT_EQ(errno, kUntouched);
    for (const char *absent : {"/nowhere/at/all", driver::kDecoderNode, "/dev/zarvo_enc1", "/dev/zarvo_"})
      EXPECT_EQ(answer(spelled(absent, O_RDWR)), -ENOENT) << absent;
  };
  check("open", open);
  check("open64", open64);
  check("__open_2", __open_2);
  check("__open64_2", __open64_2);
  check("openat", std::bind_front(openat, AT_FDCWD));
  check("openat64", std::bind_front(openat64, AT_FDCWD));
  check("__openat_2", std::bind_front(__openat_2, AT_FDCWD));
  check("__openat64_2", std::bind_front(__openat64_2, AT_FDCWD));
}

// Catches: calls on other files that are changed on their way, an errno that changes on success.
TEST_F(NodeTest, OtherCallsPassThroughAndErrnoTellsFailuresOnly) {
  const std::string path = testing::TempDir() + "card_guest_" + std::to_string(getpid());
  const int file = open(path.c_str(), O_RDWR | O_CREAT | O_TRUNC, 0640);
  struct stat status {};
  ASSERT_EQ(fstat(file, &status), 0);
  EXPECT_EQ(status.st_mode & 0777, 0640u) << "the mode of open() got lost";
  EXPECT_EQ(write(file, "ordinary", 8), 8);
  unlink(path.c_str());
  for (const long result : {answer(close(-1)), answer(read(-1, nullptr, 0)), answer(dup(-1))})
    EXPECT_EQ(result, -EBADF);

  char text[8];
  u32 word = 0;
  lseek(file, 0, SEEK_SET);
  errno = kUntouched;
  EXPECT_EQ(__read_chk(file, text, sizeof text, sizeof text), 8);
  EXPECT_EQ(ioctl(file, FIONREAD, &word), 0);
  void *mapped = mmap64(nullptr, 8, PROT_READ, MAP_SHARED, file, 0);
  EXPECT_EQ(std::memcmp(mapped, "ordinary", 8), 0);
  EXPECT_EQ(munmap(mapped, 8) + close(file), 0);
  EXPECT_EQ(card::open_mappings(), 1) << "the fixture's only";
  EXPECT_EQ(ioctl(display, 0xFFFFFFFF00000000ul | driver::DISP_IOC_GET_WIDTH, &word), 0);
  EXPECT_EQ(word, 720u) << "codes are cut to 32 bits";
  EXPECT_EQ(read_mpeg4(), 0);
  EXPECT_EQ(munmap(mmap(nullptr, kRegion, PROT_READ, MAP_SHARED, encoder, 0), kRegion), 0);
  EXPECT_EQ(errno, kUntouched);
}

TEST_F(NodeTest, DuplicatesAreNodesToo) {
  const int original = open(driver::kDisplayNode, O_RDWR);
  const int low = dup(original);
  for (const int copy : {low, dup2(original, 200), dup3(original, 201, O_CLOEXEC),
                         fcntl(original, F_DUPFD, 100), fcntl(original, F_DUPFD_CLOEXEC, 100)}) {
    EXPECT_EQ(send(copy, driver::DISP_IOC_GET_WIDTH, 0u), 0);
    EXPECT_EQ(dup2(copy, copy), copy);
  }
  EXPECT_EQ(card::open_descriptors(), 10);
  EXPECT_EQ(close(original) + close(low), 0);
  EXPECT_EQ(send(200, driver::DISP_IOC_GET_WIDTH, 0u), 0);
  closefrom(100);
  EXPECT_EQ(card::open_descriptors(), 4);
}

// Catches: calls on somebody else's file that go to the card, since the number was once the card's.
TEST_F(NodeTest, ANumberThatWasReplacedOrClosedIsNoLongerTheCards) {
  const int file = open(kOrdinary, O_RDONLY);
  const int replaced = open(driver::kEncoderNode, O_RDWR);
  ASSERT_EQ(dup2(file, replaced), replaced);
  EXPECT_EQ(content(replaced), kContent);
  close(replaced);

  const int closed = fcntl(encoder, F_DUPFD, 500);
  const auto number = static_cast<unsigned>(closed);
  ASSERT_EQ(close_range(number, number, CLOSE_RANGE_CLOEXEC), 0);
  EXPECT_EQ(card::open_descriptors(), 5) << "a number that is only marked is closed";
  ASSERT_EQ(close_range(number, number, 0), 0);
  ASSERT_EQ(fcntl(file, F_DUPFD, 500), closed);
  EXPECT_EQ(content(closed), kContent);
  closefrom(500);
  EXPECT_EQ(read_node(closed, nullptr, 0), -EBADF);
  close(file);
  EXPECT_EQ(card::open_descriptors(), 4);
}

TEST_F(NodeTest, MappingsFollowTheNodesRules) {
  const auto map = [](int fd, std::size_t length, int protection, int flags, off_t offset = 0) -> long {
    void *mapped = mmap64(nullptr, length, protection, flags, fd, offset);
    if (mapped == MAP_FAILED) return -errno;
    EXPECT_EQ(card::open_mappings(), 2);
    return munmap(mapped, length);
  };
  constexpr int kBoth = PROT_READ | PROT_WRITE;
  constexpr std::size_t kPreview = driver::kPreviewBufferSize;
  EXPECT_EQ(map(encoder, kRegion, kBoth, MAP_SHARED), 0);
  EXPECT_EQ(map(encoder, kRegion + 1, PROT_READ, MAP_SHARED), -EINVAL);
  EXPECT_EQ(map(encoder, kRegion, PROT_READ, MAP_SHARED, 4096), -EINVAL);
  EXPECT_EQ(map(encoder, 4096, PROT_READ, MAP_PRIVATE), -EINVAL);
  EXPECT_EQ(map(display, kPreview, PROT_READ, MAP_SHARED), 0);
  EXPECT_EQ(map(display, kPreview, kBoth, MAP_SHARED), -EACCES);
  EXPECT_EQ(map(display, kPreview + 1, PROT_READ, MAP_SHARED), -EINVAL);
  EXPECT_EQ(map(audio, 4096, PROT_READ, MAP_SHARED), -ENODEV);
  EXPECT_EQ(map(video_input, 4096, PROT_READ, MAP_SHARED), -ENODEV);
  EXPECT_EQ(card::open_mappings(), 1) << "the fixture's only";
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

// Catches: a child that waits for the card's threads, which it does not have; options that do not reach the
// card.
TEST_F(NodeTest, AForkedChildLosesTheCardAndCanOpenItsOwn) {
  const pid_t child = fork();
  if (child == 0) {
    setenv("ZARVO_VIRTUAL_CARD", "lost=1;silent=2;board=cc", 1);
    bool good = card::open_descriptors() == 0 && send(encoder, driver::ENC_IOC_START) == -ENODEV &&
                read_mpeg4() == -ENODEV && close(encoder) == 0 && answer(close(encoder)) == -EBADF &&
                content(open(kOrdinary, O_RDONLY)) == kContent;
    card::set_clock(card::ClockMode::manual);  // ThreadSanitizer ends a forked child that starts a thread
    video_input = open(driver::kVideoInputNode, O_RDWR);
    good = good && board_command(driver::kBoardVersion) == 0xCC &&
           card::decoder_register(0, driver::kDecoderStatus) == 0xDE && close(video_input) == 0;
    _exit(good ? 0 : 1);
  }
  int status = -1;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(card::open_descriptors(), 4);
  start();
}

}  // namespace

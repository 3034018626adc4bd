// The result file on a real disk: what counts as a taken name, what a failed
// or interrupted save leaves behind, file systems without hard links, and
// the name itself.
#include "main/result_directory.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "main/result_name.h"

namespace cvn {
namespace {

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

// Fails the disk steps as a full disk or a FAT-formatted stick would, or
// sends a signal in the middle of the writing.
class FaultyDisk : public WorkingDirectory {
 public:
  using WorkingDirectory::WorkingDirectory;
  size_t room = SIZE_MAX;
  int link_error = 0;
  int signal_number = 0;
  std::vector<std::string> seen_while_writing;

 protected:
  ssize_t writeSome(int fd, const uint8_t* data, size_t size) override {
    if (seen_while_writing.empty()) {
      for (const auto& entry : std::filesystem::directory_iterator(path()))
        seen_while_writing.push_back(entry.path().filename().string());
      std::sort(seen_while_writing.begin(), seen_while_writing.end());
    }
    if (signal_number) {
      EXPECT_EQ(WorkingDirectory::writeSome(fd, data, size / 2), static_cast<ssize_t>(size / 2));
      raise(signal_number);
    }
    if (room == 0) {
      errno = ENOSPC;
      return -1;
    }
    ssize_t n = WorkingDirectory::writeSome(fd, data, std::min(size, room));
    if (n > 0) room -= static_cast<size_t>(n);
    return n;
  }
  int linkName(const char* existing, const char* new_name) override {
    if (link_error == 0) return WorkingDirectory::linkName(existing, new_name);
    errno = link_error;
    return -1;
  }
};

class ResultDirectoryTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char tmpl[] = "/tmp/cvn-result-XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    folder_ = tmpl;
  }
  void TearDown() override { std::filesystem::remove_all(folder_); }

  std::vector<std::string> files() const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(folder_))
      names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
  }
  std::string at(const std::string& name) const { return folder_ + "/" + name; }

  const std::vector<uint8_t> image_ = std::vector<uint8_t>(100000, 'q');
  std::string folder_;
};

TEST_F(ResultDirectoryTest, AnythingThatBearsTheNameIsTaken) {
  const struct {
    const char* what;
    std::function<int(const std::string&)> make;
  } cases[] = {
      {"file",
       [](const std::string& p) { return close(open(p.c_str(), O_CREAT | O_WRONLY, 0644)); }},
      {"dangling link",
       [&](const std::string& p) { return symlink(at("gone").c_str(), p.c_str()); }},
      {"FIFO", [](const std::string& p) { return mkfifo(p.c_str(), 0644); }},
      {"directory", [](const std::string& p) { return mkdir(p.c_str(), 0755); }},
  };
  WorkingDirectory directory(folder_);
  EXPECT_FALSE(directory.isTaken(at("free.qax")));
  for (const auto& c : cases) {
    const std::string path = at(std::string(c.what) + ".qax");
    ASSERT_EQ(c.make(path), 0) << c.what;
    EXPECT_TRUE(directory.isTaken(path)) << c.what;
    EXPECT_EQ(directory.writeFile(path, image_), SaveOutcome::kNameTaken) << c.what;
  }
  // Nothing was written through the link, and no temporary file is left.
  EXPECT_EQ(files(), (std::vector<std::string>{"FIFO.qax", "dangling link.qax", "directory.qax",
                                               "file.qax"}));
  EXPECT_EQ(readFile(at("file.qax")), "");
}

// A full disk or a refused name leaves only the earlier result. FAT on a USB
// stick and some network shares refuse link(): the name is then claimed
// exclusively and the temporary file renamed over the claim.
TEST_F(ResultDirectoryTest, AFailedSaveLeavesOnlyTheEarlierResult) {
  const struct {
    const char* what;
    size_t room;
    int link_error;
    SaveOutcome outcome;
  } cases[] = {
      {"disk full at once", 0, 0, SaveOutcome::kFailed},
      {"disk full half way", 50000, 0, SaveOutcome::kFailed},
      {"naming refused", SIZE_MAX, EIO, SaveOutcome::kFailed},
      {"no room for the name", SIZE_MAX, ENOSPC, SaveOutcome::kFailed},
      {"no hard links", SIZE_MAX, EPERM, SaveOutcome::kSaved},
      {"no hard links here either", SIZE_MAX, ENOTSUP, SaveOutcome::kSaved},
  };
  std::ofstream(at("earlier.qax")) << "earlier result";
  // Whatever the outcome, the save gives back the signals it held and the
  // files it opened, and writes beside the result under a hidden name.
  auto held_and_open = [] {
    sigset_t held;
    sigprocmask(SIG_BLOCK, nullptr, &held);
    return std::to_string(sigismember(&held, SIGINT) + sigismember(&held, SIGTERM)) + " " +
           std::to_string(std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {}));
  };
  const std::string before = held_and_open();
  const std::vector<std::string> while_writing = {
      ".cvnmacagent-" + std::to_string(getpid()) + ".tmp", "earlier.qax"};
  for (const auto& c : cases) {
    FaultyDisk disk(folder_);
    disk.room = c.room;
    disk.link_error = c.link_error;
    EXPECT_EQ(disk.writeFile(at("new.qax"), image_), c.outcome) << c.what;
    EXPECT_EQ(held_and_open(), before) << c.what;
    EXPECT_EQ(disk.seen_while_writing, while_writing) << c.what;
    if (c.outcome == SaveOutcome::kSaved) {
      EXPECT_EQ(readFile(at("new.qax")), std::string(image_.begin(), image_.end())) << c.what;
      EXPECT_EQ(disk.writeFile(at("new.qax"), {'x'}), SaveOutcome::kNameTaken) << c.what;
      EXPECT_EQ(files(), (std::vector<std::string>{"earlier.qax", "new.qax"})) << c.what;
      std::filesystem::remove(at("new.qax"));
    }
    EXPECT_EQ(files(), std::vector<std::string>{"earlier.qax"}) << c.what;
  }
  EXPECT_EQ(readFile(at("earlier.qax")), "earlier result");
}

// Ctrl-C, kill or a closed SSH session in the middle of the save end the
// agent as before, without a partial file under any name.
TEST_F(ResultDirectoryTest, ASignalDuringTheSaveRemovesWhatItMade) {
  for (int link_error : {0, EPERM}) {
    for (int signal_number : {SIGINT, SIGTERM, SIGHUP}) {
      FaultyDisk disk(folder_);
      disk.signal_number = signal_number;
      disk.link_error = link_error;
      EXPECT_EXIT(disk.writeFile(at("result.qax"), image_),
                  ::testing::KilledBySignal(signal_number), "");
      EXPECT_EQ(files(), std::vector<std::string>{}) << signal_number;
    }
  }
}

TEST(ResultNameTest, TheNameStaysOneFittingNameInTheDirectory) {
  std::string accented = "x";
  for (int i = 0; i < 150; ++i) accented += "\xC3\xA9";
  const struct {
    std::string host, address;
    int counter;
    std::string name;
  } cases[] = {
      {"Jane-MBP", "00-26-BB-5C-3A-91", 12, "JANE-MBP_0026BB5C3A91(12).qax"},
      {std::string("a\nb\0c\x7F", 6), "AA/BB", 0, "A_B_C__AA_BB.qax"},
      {".hidden", "", 1, "_HIDDEN_(1).qax"},
      {"", "", 0, "_.qax"},
      // Cut to 226 bytes, one less so as not to split an é.
      {accented, "00-26-BB-5C-3A-91", 0, "X" + accented.substr(1, 224) + "_0026BB5C3A91.qax"},
  };
  for (const auto& c : cases)
    EXPECT_EQ(makeResultName(c.host, c.address).fileName(c.counter), c.name) << c.host;
  // Whatever the parts and the counter, the name fits the file system.
  EXPECT_EQ(makeResultName(std::string(400, 'h'), "00-26-BB-5C-3A-91").fileName(INT_MAX).size(),
            kMaxFileNameLength);
  EXPECT_EQ(makeResultName("h", std::string(400, 'a')).fileName(INT_MAX).size(),
            kMaxFileNameLength);
}

}  // namespace
}  // namespace cvn

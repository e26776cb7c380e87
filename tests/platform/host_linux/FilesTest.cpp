// The real files: path forms, what is no file, and writes that must not lose what was there.
#include <fcntl.h>
#include <grp.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>

#include "platform/Host.h"
#include "platform/host_linux/ChildProcess.h"

namespace panelglow::platform {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

constexpr uid_t kNobody = 65534;

Files& files() { return TheHost().files; }

class FilesTest : public testing::Test {
 protected:
  void SetUp() override {
    std::string name = testing::TempDir() + "/files-test-XXXXXX";
    ASSERT_NE(::mkdtemp(name.data()), nullptr);
    folder = fs::canonical(name);
    former = fs::current_path();
    fs::current_path(folder);
  }
  void TearDown() override {
    fs::current_path(former);
    fs::remove_all(folder);
  }
  static void Put(const fs::path& path, const std::string& content) { std::ofstream(path) << content; }
  [[nodiscard]] std::size_t Entries() const {
    return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder), fs::directory_iterator()));
  }

  fs::path folder;
  fs::path former;
};

TEST_F(FilesTest, TheProgramsPathFormsNameTheSystemsFiles) {
  fs::create_directory("sub");
  Put("sub/a.ini", "x");
  std::string fromRoot = folder.string() + "/sub/a.ini";
  std::replace(fromRoot.begin(), fromRoot.end(), '/', '\\');  // "\folder\..." is the root of the current drive
  for (const std::string& path : {"sub\\a.ini"s, ".\\sub\\a.ini"s, "./sub/../sub\\a.ini"s, fromRoot}) {
    EXPECT_TRUE(files().CanRead(path)) << path;
    EXPECT_EQ(files().Read(path), "x") << path;
    EXPECT_EQ(files().FileName(path), "a.ini") << path;
    EXPECT_EQ(files().FullPath(path), folder.string() + "/sub/a.ini") << path;
  }
  EXPECT_EQ(files().FullPath("..\\missing"), folder.parent_path().string() + "/missing");
  EXPECT_EQ(files().CurrentDirectory(), folder);
  fs::current_path("/");
  EXPECT_EQ(files().FullPath(".\\kill.ctl"), files().FullPath("\\kill.ctl"));
  EXPECT_EQ(files().FullPath("\\kill.ctl"), "/kill.ctl");
}

TEST_F(FilesTest, WhatIsNoFileIsNotReadAndNotWritten) {
  fs::create_directory("folder");
  ASSERT_EQ(::mkfifo("fifo", 0600), 0);  // opening one for reading must not block
  fs::create_symlink("/dev/full", "device");
  for (const char* path : {"", "folder", "fifo", "device", "missing\\file"}) {
    EXPECT_FALSE(files().CanRead(path)) << path;
    EXPECT_EQ(files().Read(path), std::nullopt) << path;
    EXPECT_EQ(files().ReadLocked(path), std::nullopt) << path;
    EXPECT_FALSE(files().Write(path, "x")) << path;
    EXPECT_FALSE(files().WriteLocked(path, "x")) << path;
  }
  EXPECT_FALSE(files().Remove("missing"));
  EXPECT_FALSE(files().Remove("folder"));
  EXPECT_EQ(Entries(), 3U);
}

TEST_F(FilesTest, AHugeFileCountsAsUnreadable) {
  Put("huge", "");
  fs::resize_file("huge", Files::kLargestFile_bytes + 1);  // takes no space
  EXPECT_TRUE(files().CanRead("huge"));
  EXPECT_EQ(files().Read("huge"), std::nullopt);
  EXPECT_EQ(files().ReadLocked("huge"), std::nullopt);
}

TEST_F(FilesTest, WhatIsWrittenReplacesTheWholeContent) {
  for (const std::string& content : {"a long first content"s, "short"s, ""s, "nul\0inside"s}) {
    EXPECT_TRUE(files().Write(".\\plain", content));
    EXPECT_TRUE(files().WriteLocked(".\\locked", content));
    EXPECT_EQ(files().Read("plain"), content);
    EXPECT_EQ(files().ReadLocked("locked"), content);
  }
  EXPECT_EQ(Entries(), 2U) << "no temporary file is left";
  EXPECT_TRUE(files().Remove(".\\plain"));
  EXPECT_FALSE(files().CanRead("plain"));
}

TEST_F(FilesTest, ALockedWriteKeepsALinkAndTheFilesRights) {
  Put("target", "old");
  ASSERT_EQ(::chmod("target", 0640), 0);
  fs::create_symlink("target", "link");
  fs::create_symlink("new", "dangling");
  EXPECT_TRUE(files().WriteLocked("link", "new content"));
  EXPECT_TRUE(files().WriteLocked("dangling", "new content"));
  EXPECT_TRUE(fs::is_symlink("link"));
  EXPECT_TRUE(fs::is_symlink("dangling"));
  EXPECT_EQ(files().Read("target"), "new content");
  EXPECT_EQ(files().Read("new"), "new content");
  EXPECT_EQ(fs::status("target").permissions(), fs::perms(0640));
}

// A limit of the file size stands for a full disk: the first bytes are taken, the rest is not.
TEST_F(FilesTest, ALockedWriteThatFindsNoSpaceKeepsTheOldContent) {
  Put("old", "old content");
  ChildProcess child([](int) {
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit limit{4096, 4096};
    ::setrlimit(RLIMIT_FSIZE, &limit);
    const std::string tooMuch(10'000, 'x');
    return (files().WriteLocked("old", tooMuch) ? 1 : 0) + (files().WriteLocked("new", tooMuch) ? 2 : 0);
  });
  EXPECT_EQ(child.Wait(), 0);
  EXPECT_EQ(files().Read("old"), "old content");
  EXPECT_EQ(Entries(), 1U) << "neither the new file nor a temporary one";
}

// Too large a file ends the writer in the midst of its write. What it leaves is the next writer's to remove; a file
// that another one is still writing is not, nor is one of another name.
TEST_F(FilesTest, WhatAKilledWriterLeftIsRemovedByTheNextOneAndNothingElse) {
  Put("log.xml", "old");
  for (const char* name : {"log.xml.panelglow-alive1", "log.xml.panelglow-other", "log.xml.backup", "log.xml2"}) {
    Put(name, "");
  }
  const posix::Descriptor alive(::open("log.xml.panelglow-alive1", O_RDONLY | O_CLOEXEC));
  ASSERT_EQ(::flock(alive.Get(), LOCK_EX), 0);
  for (const bool isKilled : {true, false}) {
    ChildProcess child([isKilled](int) {
      const rlimit limit{4096, 4096};
      ::setrlimit(RLIMIT_FSIZE, &limit);
      return files().WriteLocked("log.xml", isKilled ? std::string(10'000, 'x') : "new") ? 7 : 8;
    });
    EXPECT_EQ(child.Wait(), isKilled ? -SIGXFSZ : 7);
    EXPECT_EQ(files().Read("log.xml"), isKilled ? "old" : "new");
    EXPECT_EQ(Entries(), isKilled ? 6U : 5U);
  }
  EXPECT_TRUE(fs::exists("log.xml.panelglow-alive1"));
}

// What a user who is not root meets: a folder that takes no new file, and another user's file that all may write.
TEST_F(FilesTest, AFileThatCannotBeReplacedIsWrittenInPlace) {
  for (const fs::perms rights : {fs::perms(0755), fs::perms(01777)}) {
    Put("shared", "a longer old content");
    ASSERT_EQ(::chmod("shared", 0666), 0);
    fs::permissions(folder, rights);
    struct stat before {};
    struct stat after {};
    ASSERT_EQ(::stat("shared", &before), 0);
    if (::geteuid() != 0) {
      fs::permissions(folder, fs::perms(0555));
    }
    ChildProcess child([](int) {
      if (::geteuid() == 0 && (::setgroups(0, nullptr) != 0 || ::setgid(kNobody) != 0 || ::setuid(kNobody) != 0)) {
        return 90;
      }
      std::signal(SIGXFSZ, SIG_IGN);
      const int written = files().WriteLocked("shared", "new content") ? 0 : 1;
      const rlimit limit{4096, 4096};
      ::setrlimit(RLIMIT_FSIZE, &limit);
      return written + (files().WriteLocked("shared", std::string(10'000, 'x')) ? 2 : 0);
    });
    EXPECT_EQ(child.Wait(), 0);
    EXPECT_EQ(files().Read("shared"), "new content");
    ASSERT_EQ(::stat("shared", &after), 0);
    EXPECT_EQ(before.st_ino, after.st_ino);
    fs::permissions(folder, fs::perms(0755));
    EXPECT_EQ(Entries(), 1U);
  }
}

}  // namespace
}  // namespace panelglow::platform

// A file that appears whole or not at all.
#include "host/output/OutputFile.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace vesk::host {
namespace {

class OutputFileTest : public testing::Test {
 protected:
  OutputFileTest() { std::filesystem::create_directories(folder_); }
  ~OutputFileTest() override { std::filesystem::remove_all(folder_); }

  std::string path(const char *name) const { return folder_ + "/" + name; }
  std::size_t filesThere() const {
    return static_cast<std::size_t>(std::distance(std::filesystem::directory_iterator(folder_), {}));
  }
  static std::string contents(const std::string &path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
  }

  const std::string folder_ = testing::TempDir() + "/output." + std::to_string(::getpid());
};

TEST_F(OutputFileTest, TakesItsNameAtCommitOnly) {
  OutputFile file(path("out"));
  file.write("hello");
  EXPECT_FALSE(std::filesystem::exists(path("out")));
  file.commit();
  EXPECT_EQ(contents(path("out")), "hello");
  EXPECT_EQ(filesThere(), 1u);
}

TEST_F(OutputFileTest, LeavesNothingBehindWithoutCommit) {
  { OutputFile(path("out")).write("half"); }
  EXPECT_EQ(filesThere(), 0u);
}

TEST_F(OutputFileTest, KeepsWhatWasThereUntilItIsWhole) {
  std::ofstream(path("out")) << "old";
  {
    OutputFile file(path("out"));
    file.write("half");
  }
  EXPECT_EQ(contents(path("out")), "old");
  OutputFile file(path("out"));
  file.write("new");
  file.commit();
  EXPECT_EQ(contents(path("out")), "new");
}

TEST_F(OutputFileTest, HasTheRightsThatAnyNewFileHas) {
  const mode_t mask = ::umask(027);
  OutputFile file(path("out"));
  file.commit();
  ::umask(mask);
  struct stat status {};
  ASSERT_EQ(::stat(path("out").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777, 0640u);
}

TEST_F(OutputFileTest, WritesToADeviceAsItIs) {
  OutputFile file("/dev/null");
  file.write("gone");
  file.commit();
  EXPECT_TRUE(std::filesystem::is_character_file("/dev/null"));
}

TEST_F(OutputFileTest, EndsWhereItWasWholeIfItHasItsNameAlready) {
  rlimit before{};
  ::getrlimit(RLIMIT_FSIZE, &before);
  const auto handler = std::signal(SIGXFSZ, SIG_IGN);
  OutputFile file(path("out"));
  file.publish();
  const rlimit limit{1000, before.rlim_max};
  ::setrlimit(RLIMIT_FSIZE, &limit);
  file.write(std::string(600, 'a'));
  EXPECT_THROW(file.write(std::string(600, 'b')), OutputError);
  EXPECT_EQ(contents(path("out")), std::string(600, 'a'));
  file.write(std::string(400, 'c'));
  ::setrlimit(RLIMIT_FSIZE, &before);
  std::signal(SIGXFSZ, handler);
  EXPECT_EQ(contents(path("out")), std::string(600, 'a') + std::string(400, 'c'));
}

TEST_F(OutputFileTest, NamesTheFileAndTheReason) {
  const auto messageOf = [](auto &&action) -> std::string {
    try {
      action();
    } catch (const OutputError &error) {
      return error.what();
    }
    return "nothing was thrown";
  };
  EXPECT_EQ(messageOf([] { OutputFile("/no/such/folder/out"); }),
            "/no/such/folder/out: cannot be created: No such file or directory");
  EXPECT_EQ(messageOf([] { OutputFile("/dev/full").write("x"); }),
            "/dev/full: cannot be written: No space left on device");
}

}  // namespace
}  // namespace vesk::host

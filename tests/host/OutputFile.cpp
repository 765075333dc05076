// A file that appears whole or not at all.
#include "host/output/OutputFile.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
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

TEST_F(OutputFileTest, FollowsLinksToTheFileThatTheyMean) {
  std::filesystem::create_directory(path("folder"));
  std::filesystem::create_symlink("folder/target", path("second"));
  std::filesystem::create_symlink(path("second"), path("link"));
  for (const char *text : {"new", "newer"}) {  // the target is made, then replaced
    OutputFile file(path("link"));
    file.write(text);
    file.commit();
    EXPECT_TRUE(std::filesystem::is_symlink(path("link")));
    EXPECT_EQ(contents(path("folder/target")), text);
  }
  EXPECT_EQ(filesThere(), 3u);
}

TEST_F(OutputFileTest, WritesToAnOpenDescriptorWhereALinkLeadsToOne) {
  std::FILE *open = std::fopen(path("open").c_str(), "w");
  ASSERT_NE(open, nullptr);
  std::fputs("before ", open);
  std::fflush(open);
  std::filesystem::create_symlink("/proc/self/fd/" + std::to_string(::fileno(open)), path("link"));
  {
    OutputFile file(path("link"));
    file.write("here");
    file.commit();
  }
  std::fclose(open);
  EXPECT_TRUE(std::filesystem::is_symlink(path("link")));
  EXPECT_EQ(contents(path("open")), "before here");
}

TEST_F(OutputFileTest, LinksWithoutAnEndAreAnError) {
  std::filesystem::create_symlink(path("b"), path("a"));
  std::filesystem::create_symlink(path("a"), path("b"));
  EXPECT_THROW(OutputFile(path("a")).commit(), OutputError);
}

TEST_F(OutputFileTest, ASignalThatKillsRemovesWhatIsNotWhole) {
  for (const int number : {SIGHUP, SIGINT, SIGTERM}) {
    const pid_t child = ::fork();
    if (child == 0) {
      OutputFile file(path("out"));
      file.write("half");
      ::raise(number);
      ::_exit(0);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == number) << number;
    EXPECT_EQ(filesThere(), 0u) << number;
  }
  {
    OutputFile file(path("out"));
    file.commit();
  }
  struct sigaction now {};
  ASSERT_EQ(::sigaction(SIGTERM, nullptr, &now), 0);
  EXPECT_EQ(now.sa_handler, SIG_DFL) << "afterwards signals do what they did";
}

TEST_F(OutputFileTest, TwoAtOnceAndSignalsThatAreIgnored) {
  const auto before = std::signal(SIGHUP, SIG_IGN);
  {
    OutputFile first(path("first")), second(path("second"));
    second.commit();
    first.commit();
  }
  EXPECT_EQ(std::signal(SIGHUP, before), SIG_IGN) << "stays ignored";
  EXPECT_EQ(filesThere(), 2u);
}

TEST_F(OutputFileTest, AReaderOfANamedPipeThatLeavesIsAnError) {
  ASSERT_EQ(::mkfifo(path("pipe").c_str(), 0600), 0);
  const int reader = ::open(path("pipe").c_str(), O_RDONLY | O_NONBLOCK);
  OutputFile file(path("pipe"));
  ::close(reader);
  const auto before = std::signal(SIGPIPE, SIG_IGN);
  EXPECT_THROW(file.write("gone"), OutputError);
  std::signal(SIGPIPE, before);
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

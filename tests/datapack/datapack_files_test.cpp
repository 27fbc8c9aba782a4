// What datapack does to the files it writes and reads: kinds of output target, interruption, write
// errors, oversized inputs. Each test makes its own FIFOs and links in a scratch folder and never
// touches a real device node, so that it is safe as root.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <thread>
#include <vector>

#include "tests/datapack/run_datapack.h"

#if !defined(_WIN32)
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>
#include <csignal>

#include "host/channel_library.h"
#endif

namespace {

namespace fs = std::filesystem;

#if !defined(_WIN32)

std::vector<std::string> Names(const fs::path& folder) {
  std::vector<std::string> names;
  for (const auto& entry : fs::directory_iterator(folder))
    names.push_back(entry.path().filename().string());
  std::sort(names.begin(), names.end());
  return names;
}

fs::path Program() { return fs::path(ExecutableFolder()) / "datapack"; }

// Starts datapack with these arguments; `input` and `output` become its standard streams.
pid_t Start(const std::vector<std::string>& arguments, int input, int output) {
  const pid_t child = fork();
  if (child == 0) {
    dup2(input, 0);
    dup2(output, 1);
    std::vector<std::string> words = {Program().string()};
    words.insert(words.end(), arguments.begin(), arguments.end());
    std::vector<char*> argv;
    for (std::string& word : words)
      argv.push_back(word.data());
    argv.push_back(nullptr);
    execv(argv[0], argv.data());
    _exit(127);
  }
  return child;
}

int Wait(pid_t child) {
  int status = 0;
  waitpid(child, &status, 0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

#endif

TEST(DatapackFilesTest, OutputsRespectWhatTheyWriteTo) {
#if defined(_WIN32)
  GTEST_SKIP() << "modes, links and FIFOs are POSIX";
#else
  const fs::path folder = ScratchFolder();
  const fs::path input = folder / "players.pkg";
  WriteBytes(input, kPlayersPackage);
  const std::string scrambled = RunDatapack({"scramble", input.string()}).out;

  // A regular file keeps its mode, and its owner.
  const fs::path kept = folder / "kept.pkg";
  WriteBytes(kept, "old");
  chmod(kept.c_str(), 0640);
  EXPECT_EQ(RunDatapack({"scramble", input.string(), "-o", kept.string()}).status, 0);
  struct stat status;
  ASSERT_EQ(stat(kept.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0640u);
  EXPECT_EQ(ReadBytes(kept), scrambled);

  // A link stays a link; its target is replaced, also when it does not exist yet.
  const fs::path target = folder / "target.pkg";
  const fs::path link = folder / "link.pkg";
  const fs::path dangling = folder / "dangling.pkg";
  WriteBytes(target, "old");
  fs::create_symlink("target.pkg", link);
  fs::create_symlink("later.pkg", dangling);
  EXPECT_EQ(RunDatapack({"scramble", input.string(), "-o", link.string()}).status, 0);
  EXPECT_TRUE(fs::is_symlink(link));
  EXPECT_EQ(ReadBytes(target), scrambled);
  EXPECT_EQ(RunDatapack({"demo", "-o", dangling.string()}).status, 0);
  EXPECT_TRUE(fs::is_symlink(dangling));
  EXPECT_EQ(ReadBytes(folder / "later.pkg"), kPlayersPackage);

  // A FIFO is written into, not replaced.
  const fs::path fifo = folder / "fifo";
  ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
  std::string received;
  std::thread reader([&] { received = ReadBytes(fifo); });
  const RunResult throughFifo = RunDatapack({"scramble", input.string(), "-o", fifo.string()});
  reader.join();
  EXPECT_EQ(throughFifo.status, 0) << throughFifo.err;
  EXPECT_EQ(received, scrambled);
  EXPECT_TRUE(fs::is_fifo(fifo));

  // Writing over the input is refused, through a link too, unless nothing would change.
  const RunResult over = RunDatapack({"scramble", input.string(), "-o", link.string()});
  const RunResult self = RunDatapack({"scramble", input.string(), "-o", input.string()});
  EXPECT_EQ(self.status, 1);
  EXPECT_NE(self.err.find("datapack: will not write over the input file"), std::string::npos)
      << self.err;
  EXPECT_EQ(ReadBytes(input), kPlayersPackage);
  const RunResult viaLink = RunDatapack({"unscramble", link.string(), "-o", target.string()});
  EXPECT_EQ(viaLink.status, 1);
  EXPECT_EQ(ReadBytes(target), scrambled);
  const fs::path empty = folder / "empty";
  WriteBytes(empty, "");
  EXPECT_EQ(RunDatapack({"scramble", empty.string(), "-o", empty.string()}).status, 0);
  EXPECT_EQ(over.status, 0);

  EXPECT_EQ(Names(folder),
            (std::vector<std::string>{"dangling.pkg", "empty", "fifo", "kept.pkg", "later.pkg",
                                      "link.pkg", "players.pkg", "target.pkg"}));
#endif
}

TEST(DatapackFilesTest, InterruptionsAndWriteErrorsLeaveNothingBehind) {
#if defined(_WIN32)
  GTEST_SKIP() << "signals and pipes are POSIX";
#else
  const fs::path folder = ScratchFolder();
  const fs::path output = folder / "out.pkg";
  WriteBytes(output, "old contents");
  const fs::path fifo = folder / "slow input";
  ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
  for (int signal : {SIGINT, SIGTERM}) {
    // The input never ends: the output's temporary file waits beside it until the signal.
    const int devnull = open("/dev/null", O_WRONLY);
    const pid_t child = Start({"scramble", fifo.string(), "-o", output.string()}, 0, devnull);
    const int writer = open(fifo.c_str(), O_WRONLY);
    ASSERT_GE(writer, 0);
    ASSERT_EQ(write(writer, "partial", 7), 7);
    for (int wait = 0; wait < 500 && Names(folder).size() < 3; ++wait)
      usleep(10000);
    EXPECT_EQ(Names(folder).size(), 3u) << "no temporary file to remove";
    kill(child, signal);
    EXPECT_EQ(Wait(child), 128 + signal);
    close(writer);
    close(devnull);
    EXPECT_EQ(Names(folder), (std::vector<std::string>{"out.pkg", "slow input"}));
    EXPECT_EQ(ReadBytes(output), "old contents");
  }

  // A closed pipe fails the write, for every command that writes standard output.
  WriteBytes(folder / "players.pkg", kPlayersPackage);
  const std::string package = (folder / "players.pkg").string();
  const std::vector<std::vector<std::string> > commands = {{"demo"},
                                                           {"show", package},
                                                           {"show", "--json", package},
                                                           {"scramble", package},
                                                           {"diff", package, package}};
  for (const auto& command : commands) {
    int pipeEnds[2];
    ASSERT_EQ(pipe(pipeEnds), 0);
    close(pipeEnds[0]);
    const int devnull = open("/dev/null", O_RDONLY);
    const pid_t child = Start(command, devnull, pipeEnds[1]);
    close(pipeEnds[1]);
    close(devnull);
    // diff has found nothing to print: it succeeds. The others have lost their output.
    EXPECT_EQ(Wait(child), command[0] == "diff" ? 0 : 1) << command[0];
  }

  // A file too large is refused from its size, before anything is read.
  const fs::path large = folder / "large.pkg";
  WriteBytes(large, "");
  fs::resize_file(large, 3ull << 30);  // sparse: takes no room
  for (const char* command : {"show", "check", "scramble"}) {
    const RunResult refused = RunDatapack({command, large.string()});
    EXPECT_NE(refused.status, 0) << command;
    EXPECT_NE(refused.err.find("datapack: " + large.string() + ": 3221225472 bytes, too large"),
              std::string::npos)
        << refused.err;
  }
#endif
}

TEST(DatapackFilesTest, StandardInputServesWhenNoFileIsNamed) {
  const std::string shown = RunDatapack({"show"}, kPlayersPackage).out;
  EXPECT_NE(shown.find("Players: 2 entries"), std::string::npos) << shown;
  const RunResult json = RunDatapack({"show", "--json"}, kPlayersPackage);
  EXPECT_EQ(RunDatapack({"pack"}, json.out).out, kPlayersPackage);
  EXPECT_EQ(RunDatapack({"check"}, kPlayersPackage).status, 0);
}

}  // namespace

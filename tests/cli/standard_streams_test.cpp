// quillane-cli with "-" for input and output, run as a real child process on pipes: what it
// leaves on disk when it is stopped part way, and how it meets a stream larger than its memory
// or a reader that goes away.
#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <string>
#include <vector>

#include "codecs/picture_file.h"
#include "tests/cli/cli_run.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

class StandardStreams : public CliRun {
 protected:
  void SetUp() override {
    CliRun::SetUp();
    ::signal(SIGPIPE, SIG_IGN);  // this side writes into pipes the child may close
    fs::create_directory(Path("tmp"));
  }

  // Starts quillane-cli arguments in the test's folder, TMPDIR its "tmp" folder, reading the
  // pipe in_ and writing the pipe out_; stderr goes to stderr.txt.
  void Start(const std::vector<std::string>& arguments, rlim_t addressSpace = RLIM_INFINITY) {
    int in[2], out[2];
    ASSERT_EQ(::pipe(in), 0);
    ASSERT_EQ(::pipe(out), 0);
    std::vector<std::string> words{QUILLANE_CLI_PATH};
    words.insert(words.end(), arguments.begin(), arguments.end());
    std::vector<char*> argv;
    for (std::string& w : words) argv.push_back(w.data());
    argv.push_back(nullptr);
    std::string tmp = "TMPDIR=" + Path("tmp");
    char* envp[] = {tmp.data(), nullptr};
    const std::string errors = Path("stderr.txt");
    pid_ = ::fork();
    ASSERT_GE(pid_, 0);
    if (pid_ == 0) {
      const int err = ::open(errors.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
      if (::chdir(dir_.c_str()) != 0 || err < 0) ::_exit(99);
      ::dup2(in[0], 0);
      ::dup2(out[1], 1);
      ::dup2(err, 2);
      ::close(in[1]);
      ::close(out[0]);
      ::signal(SIGPIPE, SIG_DFL);
      const rlimit limit{addressSpace, addressSpace};
      ::setrlimit(RLIMIT_AS, &limit);
      ::execve(argv[0], argv.data(), envp);
      ::_exit(98);
    }
    ::close(in[0]);
    ::close(out[1]);
    in_ = in[1];
    out_ = out[0];
  }
  // Writes bytes to the child's input (as far as the child takes them) and closes it.
  void Feed(const std::string& bytes) {
    for (std::size_t done = 0; done < bytes.size();) {
      const ssize_t n = ::write(in_, bytes.data() + done, bytes.size() - done);
      if (n <= 0) break;
      done += static_cast<std::size_t>(n);
    }
    ::close(in_);
  }
  int Wait() {
    int status = 0;
    ::waitpid(pid_, &status, 0);
    ::close(out_);
    err_ = ReadText(Path("stderr.txt"));
    return status;
  }
  // What the child left in the folder and in TMPDIR, besides its error output.
  std::vector<std::string> Left() const {
    std::vector<std::string> names;
    for (const auto& e : fs::recursive_directory_iterator(dir_))
      if (e.path().filename() != "stderr.txt" && e.path().filename() != "in.bmp" &&
          e.path().filename() != "tmp")
        names.push_back(e.path().string());
    return names;
  }

  pid_t pid_ = -1;
  int in_ = -1;
  int out_ = -1;
};

// The copies of "-" input and "-o -" output were files in TMPDIR: a signal, or a reader that
// stopped after ten bytes, left them there.
TEST_F(StandardStreams, NothingIsLeftOnDiskHoweverTheCommandEnds) {
  SaveBitmap24(RandomPicture(400, 300, 3), Path("in.bmp"));
  const std::string picture = ReadText(Path("in.bmp"));
  for (const int signal : {SIGINT, SIGTERM, SIGKILL}) {
    Start({"convert", "-", "-o", "-", "--format", "bmp"});
    Feed(picture);
    char head[10];
    ASSERT_EQ(::read(out_, head, sizeof head), 10);  // writing now, blocked on the full pipe
    ::kill(pid_, signal);
    const int status = Wait();
    EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == signal) << signal;
    EXPECT_EQ(Left(), std::vector<std::string>{}) << signal;
  }

  // A reader that has enough: a failure without a word, not a death by SIGPIPE.
  Start({"convert", "-", "-o", "-", "--format", "bmp"});
  Feed(picture);
  char head[10];
  ASSERT_EQ(::read(out_, head, sizeof head), 10);
  ::close(out_);
  const int status = Wait();
  ASSERT_TRUE(WIFEXITED(status)) << WTERMSIG(status);
  EXPECT_EQ(WEXITSTATUS(status), 1);
  EXPECT_EQ(err_, "");
  EXPECT_EQ(Left(), std::vector<std::string>{});
}

// A stream larger than the process may allocate ended in std::bad_alloc (exit 134).
TEST_F(StandardStreams, InputLargerThanTheMemoryLimitIsRefusedWithAMessage) {
#if defined(__SANITIZE_ADDRESS__)
  GTEST_SKIP() << "no address-space limit under ASan";
#endif
  const std::string chunk(1 << 20, '\0');
  Start({"convert", "-", "-o", "z.png"}, rlim_t{600} << 20);
  bool open = ::write(in_, "BM", 2) == 2;
  for (int i = 0; open && i < 1200; ++i) open = ::write(in_, chunk.data(), chunk.size()) > 0;
  EXPECT_FALSE(open);  // the child stopped reading long before the end
  ::close(in_);
  const int status = Wait();
  ASSERT_TRUE(WIFEXITED(status));
  EXPECT_EQ(WEXITSTATUS(status), 1);
  EXPECT_NE(err_.find("standard input is too large for the memory available: it needs "),
            std::string::npos)
      << err_;
  EXPECT_EQ(Left(), std::vector<std::string>{});

  // Bytes that start like no picture are refused at once.
  Start({"convert", "-", "-o", "z.png"});
  Feed(chunk);
  ASSERT_TRUE(WIFEXITED(Wait()));
  EXPECT_NE(err_.find("standard input is not a picture the program reads"), std::string::npos);
}

}  // namespace
}  // namespace quillane

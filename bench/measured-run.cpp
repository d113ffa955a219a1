#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>

// Runs a program and prints what it took as one JSON object. A small program does this rather than
// the script that drives the measurement: a process starts with the peak memory of the one that
// forked it, and a script's interpreter is larger than a small migration.

namespace {

double secondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
}

[[noreturn]] void fail(const char* operation) {
  std::fprintf(stderr, "measured-run: %s: %s\n", operation, std::strerror(errno));
  std::exit(EXIT_FAILURE);
}

[[noreturn]] void runProgram(char** programAndArguments) {
  const int nowhere = open("/dev/null", O_WRONLY);
  if (nowhere < 0 || dup2(nowhere, STDOUT_FILENO) < 0 || dup2(nowhere, STDERR_FILENO) < 0) {
    _exit(EXIT_FAILURE);
  }
  execv(programAndArguments[0], programAndArguments);
  _exit(127);
}

}  // namespace

int main(int argumentCount, char** arguments) {
  if (argumentCount < 2) {
    std::fputs("Usage: measured-run PROGRAM [ARGUMENT...]\n", stderr);
    return EXIT_FAILURE;
  }
  const auto start = std::chrono::steady_clock::now();
  const pid_t child = fork();
  if (child < 0) {
    fail("fork");
  }
  if (child == 0) {
    runProgram(arguments + 1);
  }
  int status = 0;
  // What the program's own children used is counted in, for the peak size the largest of them.
  rusage usage = {};
  if (wait4(child, &status, 0, &usage) != child) {
    fail("wait4");
  }
  const std::chrono::duration<double> wall = std::chrono::steady_clock::now() - start;
  std::printf(
      "{\"exitStatus\": %d, \"wallSeconds\": %.9f, \"userSeconds\": %.6f, \"systemSeconds\": %.6f, "
      "\"peakResidentKiB\": %ld}\n",
      WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status), wall.count(),
      secondsOf(usage.ru_utime), secondsOf(usage.ru_stime), usage.ru_maxrss);
  return EXIT_SUCCESS;
}

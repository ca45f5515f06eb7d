// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <latch>
#include <string>
#include <string_view>
#include <thread>

#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/StandardOutput.h>

// A process that logs numbered entries and ends in a given way: LoggerProcess ENDING AUTHOR COUNT
// PAUSE, the pause between entries being in milliseconds.

namespace {

// Made before the logger, and so destroyed after its exit handler has run.
struct LogsAtTheVeryEnd {
  ~LogsAtTheVeryEnd() {
    if (!author.empty()) Varnel::Logger::instance().log("late", author);
  }
  std::string author;
} logsAtTheVeryEnd;

void printOnStandardError() {
  static const auto errorOutput = Varnel::Platform::makeStandardErrorOutput();
  Varnel::Platform::Ports ports = Varnel::Platform::systemPorts();
  ports.standardOutput = *errorOutput;
  if (!installProcessPorts(ports)) std::abort();
}

void printForNobody() {
  int ends[2];
  if (::pipe(ends) != 0 || ::dup2(ends[1], STDOUT_FILENO) < 0) std::abort();
  ::close(ends[0]);
}

// The child logs as well, and ends in full order.
void logInChild(const std::string& author) {
  const pid_t child = ::fork();
  if (child == 0) {
    Varnel::Logger& logger = Varnel::Logger::instance();
    logger.log("child", author);
    // The child writes while it lives, not only when it ends.
    for (std::string text; text.find("child") == std::string::npos; std::this_thread::yield())
      std::getline(std::ifstream(logger.logFileURL()->path()), text, '\0');
    logger.log("grown", author);
    std::exit(EXIT_SUCCESS);
  }
  ::waitpid(child, nullptr, 0);
}

// The same while another thread is about to print.
void logInChildWithTheStreamHeld(const std::string& author) {
  std::latch isHeld(1);
  std::latch isOver(1);
  std::thread holder([&] {
    ::flockfile(stdout);
    isHeld.count_down();
    isOver.wait();
    ::funlockfile(stdout);
  });
  isHeld.wait();
  logInChild(author);
  isOver.count_down();
  holder.join();
}

// A host's own file. It gets the number of a standard stream that the process was not given.
void openDocument() {
  const std::string path = std::string(std::getenv("HOME")) + "/document";
  if (::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, S_IRUSR | S_IWUSR) < 0) std::abort();
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 5) return EXIT_FAILURE;
  openDocument();
  const std::string_view ending = argv[1];
  const std::string author = argv[2];
  const int count = std::atoi(argv[3]);
  const std::chrono::milliseconds pause(std::atoi(argv[4]));

  if (ending == "standard-error") printOnStandardError();
  if (ending == "without-reader") printForNobody();
  // What has been printed is seen by the reader whatever happens next.
  if (ending == "killed") std::setvbuf(stdout, nullptr, _IOLBF, 0);
  for (int i = 0; i < count; ++i) {
    Varnel::Logger::instance().log(std::to_string(i), author);
    if (pause.count() > 0) std::this_thread::sleep_for(pause);
  }
  if (ending == "forked") logInChild(author);
  if (ending == "forked-in-between") logInChildWithTheStreamHeld(author);
  if (ending == "daemon" && ::daemon(1, 1) != 0) std::abort();
  if (ending == "killed") std::raise(SIGKILL);
  if (ending == "quick-exit") std::quick_exit(EXIT_SUCCESS);
  if (ending == "late-entry" || ending == "without-reader") logsAtTheVeryEnd.author = author;
  return EXIT_SUCCESS;
}

// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <stdexcept>
#include <string>
#include <vector>

extern char** environ;

namespace Varnel::Tests {

/// A program whose standard output the test reads. Destruction kills it.
class ChildProcess final {
 public:
  explicit ChildProcess(std::vector<std::string> words) {
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, ends[1], STDOUT_FILENO);
    std::vector<char*> arguments;
    for (std::string& word : words) arguments.push_back(word.data());
    arguments.push_back(nullptr);
    const int failed =
        ::posix_spawn(&process_, arguments[0], &actions, nullptr, arguments.data(), environ);
    ::posix_spawn_file_actions_destroy(&actions);
    ::close(ends[1]);
    output_ = ::fdopen(ends[0], "r");
    if (failed != 0) throw std::runtime_error("no such program: " + words[0]);
  }
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;
  ~ChildProcess() {
    kill();
    std::fclose(output_);
  }

  /// The next line without its end, waited for; what there is when the output ends.
  std::string readLine() { return readUntil('\n'); }

  /// The next bytes, waited for.
  std::string read(std::size_t size) {
    std::string bytes(size, '\0');
    bytes.resize(std::fread(bytes.data(), 1, size, output_));
    return bytes;
  }

  /// All that is left, waited for until the output ends.
  std::string readAll() { return readUntil(EOF); }

  /// Waits for its end; its exit status, or as a shell tells a signal.
  int wait() {
    int status = 0;
    ::waitpid(process_, &status, 0);
    process_ = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
  }

  void signal(int number) const { ::kill(process_, number); }
  [[nodiscard]] ::pid_t identifier() const { return process_; }

  /// Ends the process as a crash would, if it runs.
  void kill() {
    if (process_ <= 0) return;
    ::kill(process_, SIGKILL);
    ::waitpid(process_, nullptr, 0);
    process_ = 0;
  }

 private:
  std::string readUntil(int end) {
    std::string text;
    for (int c = std::fgetc(output_); c != EOF && c != end; c = std::fgetc(output_))
      text += static_cast<char>(c);
    return text;
  }

  ::pid_t process_ = 0;
  std::FILE* output_ = nullptr;
};

/// What a command of the shell prints.
inline std::string outputOf(const std::string& command) {
  return ChildProcess({"/bin/sh", "-c", command}).readAll();
}

}  // namespace Varnel::Tests

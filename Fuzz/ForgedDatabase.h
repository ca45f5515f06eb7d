// SPDX-License-Identifier: MIT
#pragma once

#include <sqlite3.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>

/// A database that others have had in their hands, anew for each input. It begins as a good file.
/// The input up to its first null character is SQL, which is run on it as another program might;
/// then each three bytes are a place in the file and what is written there.
class ForgedDatabase final {
 public:
  /// `make` makes the good file, and ends every connection to it.
  ForgedDatabase(const std::string& name, const std::function<void(const std::string& path)>& make)
      : path_((folder_.path() / "made" / name).string()) {
    std::filesystem::create_directories(std::filesystem::path(path_).parent_path());
    make(path_);
    std::ifstream file(path_, std::ios::binary);
    good_.assign(std::istreambuf_iterator<char>(file), {});
    require(!good_.empty());
  }

  void forge(std::string_view input) const {
    const std::filesystem::path folder = std::filesystem::path(path_).parent_path();
    std::filesystem::remove_all(folder);
    std::filesystem::create_directory(folder);
    write(good_);
    const auto [sql, changes] = cutAt('\0', input);
    if (!sql.empty()) run(path_, std::string(sql));
    if (!changes.empty()) change(changes);
  }

  [[nodiscard]] const std::string& path() const { return path_; }

  /// Runs statements up to the first that fails, for a while. No other file comes to harm.
  static void run(const std::string& path, const std::string& sql) {
    constexpr int maxInstructions = 100'000;
    sqlite3* opened = nullptr;
    require(::sqlite3_open(path.c_str(), &opened) == SQLITE_OK);
    const std::unique_ptr<sqlite3, int (*)(sqlite3*)> database(opened, ::sqlite3_close);
    ::sqlite3_limit(opened, SQLITE_LIMIT_ATTACHED, 0);
    ::sqlite3_limit(opened, SQLITE_LIMIT_LENGTH, 1 << 16);
    ::sqlite3_progress_handler(
        opened, maxInstructions, [](void*) { return 1; }, nullptr);
    ::sqlite3_exec(opened, ("PRAGMA synchronous = OFF;" + sql).c_str(), nullptr, nullptr, nullptr);
  }

 private:
  void write(std::string_view bytes) const { std::ofstream(path_, std::ios::binary) << bytes; }

  void change(std::string_view changes) const {
    std::ifstream file(path_, std::ios::binary);
    std::string bytes(std::istreambuf_iterator<char>(file), {});
    const auto byteAt = [&](std::size_t place) {
      return static_cast<std::size_t>(static_cast<unsigned char>(changes[place]));
    };
    for (std::size_t i = 0; i + 2 < changes.size() && !bytes.empty(); i += 3)
      bytes[(byteAt(i) << 8 | byteAt(i + 1)) % bytes.size()] = changes[i + 2];
    write(bytes);
  }

  const Varnel::Tests::TemporaryFolder folder_ = Varnel::Tests::TemporaryFolder::inMemory();
  const std::string path_;
  std::string good_;
};

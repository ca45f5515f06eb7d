// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <string>
#include <string_view>

#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>

/// A good database with the write-ahead log of a process that was killed, which others have had in
/// their hands, anew for each input. The input's first character shortens the log. Then each three
/// bytes are a place in the log and what is written there. Its sums are right again, so that what
/// was written counts.
class ForgedLog final {
 public:
  /// `make` makes the file and, before it ends its connections, calls `keep`.
  explicit ForgedLog(
      const std::function<void(const std::string& path, const std::function<void()>& keep)>& make)
      : path_((folder_.path() / "made" / "file.db").string()) {
    std::filesystem::create_directories(std::filesystem::path(path_).parent_path());
    make(path_, [this] {
      file_ = read(path_);
      log_ = read(path_ + "-wal");
    });
    require(!file_.empty() && log_.size() > headSize);
  }

  void forge(std::string_view input) const {
    const std::filesystem::path folder = std::filesystem::path(path_).parent_path();
    std::filesystem::remove_all(folder);
    std::filesystem::create_directory(folder);
    write(path_, file_);
    std::string log = log_;
    const auto byteAt = [&](std::size_t place) {
      return static_cast<std::size_t>(static_cast<unsigned char>(input[place]));
    };
    if (!input.empty()) log.resize(log.size() - byteAt(0) * log.size() / 256);
    for (std::size_t i = 1; i + 2 < input.size() && !log.empty(); i += 3)
      log[(byteAt(i) << 8 | byteAt(i + 1)) % log.size()] = input[i + 2];
    sumUp(log);
    write(path_ + "-wal", log);
  }

  [[nodiscard]] const std::string& path() const { return path_; }

 private:
  static constexpr std::size_t headSize = 32, frameHeadSize = 24;
  using Sum = std::array<std::uint32_t, 2>;

  static std::string read(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
  }
  static void write(const std::string& path, std::string_view bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
  }

  // The words of a log are summed up in the order of bytes that its first number names.
  static std::uint32_t word(std::string_view bytes, std::size_t at, bool isBigEndian = true) {
    std::uint32_t number = 0;
    for (std::size_t i = 0; i < 4; ++i)
      number = number << 8 | static_cast<unsigned char>(bytes[at + (isBigEndian ? i : 3 - i)]);
    return number;
  }
  static Sum add(Sum sum, std::string_view log, std::size_t begin, std::size_t size) {
    const bool isBigEndian = (word(log, 0) & 1) != 0;
    for (std::size_t at = begin; at + 8 <= begin + size; at += 8) {
      sum[0] += word(log, at, isBigEndian) + sum[1];
      sum[1] += word(log, at + 4, isBigEndian) + sum[0];
    }
    return sum;
  }
  static void put(const Sum& sum, std::string& log, std::size_t at) {
    for (std::size_t i = 0; i < 8; ++i)
      log[at + i] = static_cast<char>(sum[i / 4] >> (24 - i % 4 * 8));
  }
  static void sumUp(std::string& log) {
    if (log.size() < headSize) return;
    Sum sum = add({}, log, 0, headSize - 8);
    put(sum, log, headSize - 8);
    const std::size_t page = word(log, 8);
    for (std::size_t at = headSize; page <= log.size() && at + frameHeadSize + page <= log.size();
         at += frameHeadSize + page) {
      sum = add(add(sum, log, at, 8), log, at + frameHeadSize, page);
      put(sum, log, at + 16);
    }
  }

  const Varnel::Tests::TemporaryFolder folder_ = Varnel::Tests::TemporaryFolder::inMemory();
  const std::string path_;
  std::string file_, log_;
};

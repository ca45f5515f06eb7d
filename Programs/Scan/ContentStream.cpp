// SPDX-License-Identifier: MIT
#include <Scan/ContentStream.h>

#include <algorithm>
#include <utility>

#include <Scan/ContentAccess.h>
#include <Scan/FileTree.h>

namespace Orvane {

ContentStream::ContentStream(const FileRecord& file, std::uint64_t length, Ports ports)
    : ports_(ports),
      file_(file),
      path_(file.path()),
      remaining_(std::min(length, file.status.size)) {}

ContentStream::Block ContentStream::next(std::span<std::byte> buffer) {
  if (remaining_ < buffer.size()) buffer = buffer.first(static_cast<std::size_t>(remaining_));
  Block block = Loss{Loss::Kind::unreadable, std::make_error_code(std::errc::no_such_device)};
  // A file on no known volume cannot be accessed.
  (void)ports_.access.whileAccessing(path_, file_.status.identity.device,
                                     [&] { block = readBlock(buffer); });
  return block;
}

ContentStream::Block ContentStream::readBlock(std::span<std::byte> buffer) {
  if (!open_) {
    const bool isPart = remaining_ < file_.status.size;
    auto opened = ports_.fileSystem.open(
        path_, isPart ? ReadingPlan::beginningOnly : ReadingPlan::everything);
    if (!opened) return Loss::because(opened.error());
    open_ = std::move(*opened);
  }
  for (std::size_t filled = 0; filled < buffer.size();) {
    const auto count = open_->read(buffer.subspan(filled));
    if (!count) return Loss::because(count.error());
    if (*count == 0) return Loss{Loss::Kind::changed, {}};
    filled += *count;
  }
  remaining_ -= buffer.size();
  if (remaining_ == 0) {
    const auto status = open_->status();
    if (!status) return Loss::because(status.error());
    if (*status != file_.status) return Loss{Loss::Kind::changed, {}};
    open_.reset();
  }
  return std::span<const std::byte>(buffer);
}

}  // namespace Orvane

// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include <Varnel/Provenance/KVQuarantineEntry.h>

namespace Varnel {

/// Collects the rows of a database. The records lie side by side with their texts in blocks of some
/// kilobytes, which live as long as one of their entries: a hundred thousand rows cost a few
/// hundred allocations. One thread at a time.
class DownloadList final {
 public:
  void add(std::string_view eventIdentifier, std::string_view dataURL);

  [[nodiscard]] std::vector<KVQuarantineEntry> take() { return std::move(entries_); }

 private:
  class Block;

  std::shared_ptr<Block> block_;  ///< The last one.
  std::vector<KVQuarantineEntry> entries_;
};

}  // namespace Varnel

// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/DownloadList.h>

#include <algorithm>
#include <cstddef>
#include <string>

#include <Varnel/Provenance/QuarantineRecord.h>

namespace Varnel {

// Records and texts never move: the room for both is reserved from the start.
class DownloadList::Block final {
 public:
  explicit Block(std::size_t textSize) {
    records_.reserve(maxRecords);
    texts_.reserve(std::max(textSize, usualTextSize));
  }

  [[nodiscard]] bool hasRoom(std::size_t textSize) const {
    return records_.size() < maxRecords && texts_.capacity() - texts_.size() >= textSize;
  }

  [[nodiscard]] const KVQuarantineEntry::Record* add(std::string_view eventIdentifier,
                                                     std::string_view dataURL) {
    KVQuarantineEntry::Record& record = records_.emplace_back();
    record.eventIdentifier = keep(eventIdentifier);
    record.dataURLString = keep(dataURL);
    return &record;
  }

 private:
  static constexpr std::size_t maxRecords = 256;
  static constexpr std::size_t usualTextSize = 32768;

  std::string_view keep(std::string_view text) {
    const std::size_t start = texts_.size();
    texts_ += text;
    return std::string_view(texts_).substr(start);
  }

  std::vector<KVQuarantineEntry::Record> records_;
  std::string texts_;
};

void DownloadList::add(std::string_view eventIdentifier, std::string_view dataURL) {
  const std::size_t textSize = eventIdentifier.size() + dataURL.size();
  if (!block_ || !block_->hasRoom(textSize)) block_ = std::make_shared<Block>(textSize);
  std::shared_ptr<const KVQuarantineEntry::Record> record(block_,
                                                          block_->add(eventIdentifier, dataURL));
  entries_.push_back(KVQuarantineEntry(std::move(record)));
}

}  // namespace Varnel

// SPDX-License-Identifier: MIT
#include <orvane/ScanChoice.h>

#include <filesystem>
#include <system_error>
#include <utility>

#include <orvane/Console.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

/// The folders' absolute paths without links, or none after a complaint about one that is not
/// there.
std::optional<std::vector<std::string>> resolved(const std::vector<std::string>& folders,
                                                 Console& console) {
  std::vector<std::string> paths;
  for (const std::string& folder : folders) {
    std::error_code error;
    const fs::path path = fs::canonical(folder, error);
    if (!error && !fs::is_directory(path, error) && !error)
      error = std::make_error_code(std::errc::not_a_directory);
    if (error) {
      complainThatItCannotScan(folder, error.message(), console);
      return std::nullopt;
    }
    paths.push_back(path.string());
  }
  return paths;
}

}  // namespace

std::optional<ScanRequest> ScanChoice::request(Console& console) const {
  auto ofFolders = resolved(folders, console);
  if (!ofFolders) return std::nullopt;
  auto ofReferences = resolved(references, console);
  if (!ofReferences) return std::nullopt;
  ScanRequest request{.folders = *std::move(ofFolders),
                      .references = *std::move(ofReferences),
                      .minSize = minSize,
                      .maxSize = maxSize,
                      .include = include,
                      .exclude = exclude,
                      .skipsHidden = skipsHidden,
                      .staysOnFileSystem = staysOnFileSystem};
  if (!listOfFiles) return request;
  auto files = readFileList(*listOfFiles, endOfNames);
  if (!files) {
    console.complain("cannot read the list \"" + *listOfFiles + "\": " + files.error());
    return std::nullopt;
  }
  request.files = *std::move(files);
  return request;
}

void complainThatItCannotScan(const std::string& folder, const std::string& reason,
                              Console& console) {
  console.complain("cannot scan \"" + folder + "\": " + reason);
}

}  // namespace Orvane

// SPDX-License-Identifier: MIT
// Prints the size of each file's content, never reading one disk from more threads than it bears.
//   ReadWithASession FILE…
#include <fstream>
#include <iostream>
#include <iterator>
#include <string>
#include <thread>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskAccessingSession.h>
#include <Varnel/Logging/Logger.h>

using Varnel::DiskAccessManager;
using Varnel::Platform::QualityOfService;
using Varnel::Platform::URL;

void printSize(const std::string& path) {
  const URL url = URL::fileURLWithPath(path);
  // Waits for a free place on the file's disk; null when the volume is unknown or the file
  // unreadable.
  const auto session = DiskAccessManager::shared().beginAccessingURL(url, "printing its size",
                                                                     QualityOfService::utility);
  if (!session) {
    Varnel::Logger::instance().log("Cannot read", "ReadWithASession", url);
    return;
  }
  std::ifstream file(path, std::ios::binary);
  const std::string bytes((std::istreambuf_iterator<char>(file)), {});
  session->endAccessing();  // on the thread that began
  std::cout << (path + ": " + std::to_string(bytes.size()) + " bytes\n") << std::flush;
}

int main(int count, char** arguments) {
  std::vector<std::jthread> readers;
  for (int i = 1; i < count; ++i) readers.emplace_back(printSize, std::string(arguments[i]));
}

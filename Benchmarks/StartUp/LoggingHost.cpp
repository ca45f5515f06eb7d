// SPDX-License-Identifier: MIT
// A host that logs a line, which the framework dates for people.
#include <Benchmarks/StartUp/Memory.h>
#include <Varnel/Logging/Logger.h>

int main(int argumentCount, char**) {
  Varnel::Logger::instance().log("started", "host", Varnel::LoggingContextTags());
  return Benchmarks::end(argumentCount);
}

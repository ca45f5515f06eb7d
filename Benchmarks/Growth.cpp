// SPDX-License-Identifier: MIT
// Growth [PLOT]: how cost grows with threads, waiters, disks, mounts, rows, log entries and files.
// Prints the exponent of each, fitted to the upper half of its range, beside the one to expect, and
// draws them into a file. Exits with 1 when a cost grows clearly faster than it should.
#include <sys/resource.h>
#include <time.h>

#include <array>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include <Benchmarks/Drawing.h>
#include <Benchmarks/Measurements.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/DiskAccess/DiskData.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>
#include <Varnel/Provenance/KVQuarantine.h>

namespace Varnel::Benchmarks {
namespace {

namespace fs = std::filesystem;
using Platform::URL;
using QoS = Platform::QualityOfService;

/// What grows, and what it costs.
struct Subject {
  const char* what;
  const char* of;
  double expected;  ///< The exponent: 0 does not grow, 1 is linear.
  std::vector<int> counts;
  Nanoseconds (*cost)(int count);
};

struct Curve {
  const Subject& subject;
  std::vector<Drawing::Point> points;
};

/// The processor's time so far, on all threads.
Nanoseconds ownTime() {
  timespec time{};
  ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
  return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
}

/// That of the programs which have ended.
Nanoseconds childrensTime() {
  rusage usage{};
  ::getrusage(RUSAGE_CHILDREN, &usage);
  double time = 0;
  for (const timeval& part : {usage.ru_utime, usage.ru_stime})
    time += static_cast<double>(part.tv_sec) * 1e9 + static_cast<double>(part.tv_usec) * 1e3;
  return time;
}

/// The processor's time for a call: the wall's would be that of whatever else the machine does.
template <typename Function>
Nanoseconds costOf(Function&& function, Nanoseconds (*used)() = ownTime) {
  const Nanoseconds before = used();
  function();
  return used() - before;
}

/// The best of at least three times, and of as many as half a second has room for. It knows least
/// of what else the machine does.
template <typename Function>
Nanoseconds fastest(Function&& measure) {
  constexpr Nanoseconds enough = 5e8;
  Nanoseconds best = std::numeric_limits<Nanoseconds>::max();
  Nanoseconds spent = 0;
  for (int round = 0; round < 3 || spent < enough; ++round)
    spent += timeOf([&] { best = std::min(best, measure()); });
  return best;
}

/// The same for one call. Short ones are repeated, since the processor's clock is no exact one.
template <typename Function>
Nanoseconds costOfOne(Function&& function) {
  constexpr Nanoseconds longEnough = 1e6;
  int calls = 1;
  const auto callAll = [&] {
    for (int call = 0; call < calls; ++call) function();
  };
  while (costOf(callAll) < longEnough) calls *= 2;
  return fastest([&] { return costOf(callAll) / calls; });
}

/// What one call costs when so many threads make calls at once; to start them costs next to
/// nothing.
template <typename Function>
Nanoseconds costAmong(int threads, Function&& function) {
  constexpr int calls = 500'000;
  return fastest(
      [&] { return costOf([&] { timeOfOneAmong(threads, calls / threads, function); }) / calls; });
}

Nanoseconds grantAndRelease(int threads) {
  const auto queue = std::make_shared<Basalt::SerialQueue>("growth");
  constexpr auto kindOfManyPlaces = static_cast<OVDiskKind>(1000);
  const auto disk = std::make_shared<DiskData>(
      std::make_shared<OVDiskInfo>("disk", OVDiskInfo::VolumeURLs(), kindOfManyPlaces), false,
      queue);
  return costAmong(threads, [&] {
    const Basalt::ThreadID thread = Basalt::currentThreadID();
    if (queue->sync([&] { return disk->requestAccess(thread, QoS::utility); })) std::abort();
    queue->sync([&] { disk->releaseAccess(thread); });
  });
}

Nanoseconds serialSection(int threads) {
  Basalt::SerialQueue queue("growth");
  volatile int counter = 0;
  return costAmong(threads, [&] { queue.sync([&] { counter = counter + 1; }); });
}

/// So many come to a full disk, in all classes, and are let in at once.
Nanoseconds waiters(int count) {
  const auto queue = std::make_shared<Basalt::SerialQueue>("growth");
  constexpr std::array classes = {QoS::background, QoS::userInteractive, QoS::utility,
                                  QoS::userInitiated};
  return costOfOne([&] {
    const auto disk = std::make_shared<DiskData>(
        std::make_shared<OVDiskInfo>("disk", OVDiskInfo::VolumeURLs(), OVDiskKindExternal), false,
        queue);
    const auto thread = [](int number) { return static_cast<Basalt::ThreadID>(number + 1); };
    for (int i = 0; i <= count; ++i)
      (void)queue->sync(
          [&] { return disk->requestAccess(thread(i), classes[static_cast<std::size_t>(i) % 4]); });
    queue->sync([&] { disk->releaseAccess(thread(0)); });
    if (queue->sync([&] { return disk->requestCount(); }) != 0) std::abort();
  });
}

/// The inventory of a machine with so many disks of one volume each.
Nanoseconds disks(int count) {
  Platform::Testing::FakeDeviceRegistry devices;
  Platform::Testing::FakeDiskArbitration arbitration;
  Platform::Testing::FakeVolumeCatalog volumes;
  for (int i = 0; i < count; ++i) {
    const std::string name = fmt::format("disk{}", i);
    const auto url = URL::fileURLWithPath(fmt::format("/media/{}/", name));
    const auto device = devices.plug(
        {{"SMART Capable", true},
         {"Device Characteristics",
          Platform::PropertyDictionary{{"Serial Number", name}, {"Medium Type", "Rotational"}}}});
    devices.plug({{"BSD Name", name}}, device);
    arbitration.setMountURLs(name, {url});
    volumes.mount({.url = url, .isLocal = true});
  }
  return costOfOne([&] {
    const auto all =
        OVDiskInfo::allDiskInfos({.devices = devices, .disks = arbitration, .volumes = volumes});
    if (all.size() != static_cast<std::size_t>(count)) std::abort();
  });
}

Nanoseconds mounts(int count) {
  std::string table;
  for (int i = 0; i < count; ++i)
    table += fmt::format("{} 1 8:{} / /mnt/volume-{} rw,relatime shared:1 - ext4 /dev/sd{} rw\n",
                         i + 2, i, i, i);
  return costOfOne([&] {
    const auto found = Platform::Linux::reachableMounts(Platform::Linux::parseMountInfo(table));
    if (found.size() != static_cast<std::size_t>(count)) std::abort();
  });
}

Nanoseconds downloads(int rows) {
  const Tests::TemporaryFolder folder;
  const std::string path = (folder.path() / "events").string();
  Tests::runSQL(path, Tests::createQuarantineTable() +
                          fmt::format("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 "
                                      "FROM n WHERE i < {}) "
                                      "INSERT INTO LSQuarantineEvent(LSQuarantineEventIdentifier,"
                                      " LSQuarantineDataURLString) SELECT "
                                      "printf('%08X-2F8E-4C0B-9B1B-7B9D4E2A8C11', i),"
                                      " 'https://example.org/files/' || i FROM n",
                                      rows));
  Platform::Testing::CapturedSystemLog log;
  const KVQuarantine quarantine(path, log);
  return costOfOne([&] {
    if (quarantine.entries().size() != static_cast<std::size_t>(rows)) std::abort();
  });
}

/// With what the file costs.
Nanoseconds logEntries(int count) {
  class Silent final : public Platform::StandardOutput {
    void print(std::string_view) override {}
  };
  Silent silent;
  const auto& ports = Platform::processPorts();
  return fastest([&] {
    const auto folder = Tests::TemporaryFolder::inMemory();
    Platform::Testing::FakeUserAccount user;
    user.home = folder.path().string();
    Logger logger({ports.appendFiles, ports.clock, ports.privateFiles, silent, ports.timeZones,
                   user, ports.userLocale},
                  "growth");
    return costOf([&] {
      for (int i = 0; i < count; ++i) logger.log("Did compare two files: equal", "Scanner");
      logger.flush();
    });
  });
}

/// A whole run of orvane over files in memory. Two thirds of them are in groups of three.
Nanoseconds scannedFiles(int count) {
  const auto folder = Tests::TemporaryFolder::inMemory();
  for (int i = 0; i < count; ++i) {
    const fs::path below = folder.path() / "files" / std::to_string(i / 1000);
    if (i % 1000 == 0) fs::create_directories(below);
    const int content = i % 9 < 3 ? i : count + i / 9 * 9 + i % 9 / 3;
    std::ofstream(below / std::to_string(i)) << fmt::format("{:020}", content);
  }
  const std::string command =
      fmt::format("HOME={0} '{1}' scan --json {0}/files >{0}/found", folder.path().string(),
                  (fs::canonical("/proc/self/exe").parent_path() / "orvane").string());
  return fastest([&] {
    return costOf(
        [&] {
          if (std::system(command.c_str()) != 0) std::exit(EXIT_FAILURE);
        },
        childrensTime);
  });
}

/// 1, 3, 10, 30 and so on.
std::vector<int> steps(int from, int to) {
  std::vector<int> counts;
  for (int decade = from; decade <= to; decade *= 10)
    for (const int count : {decade, 3 * decade})
      if (count <= to) counts.push_back(count);
  return counts;
}

const std::vector<int> threadCounts = {1, 2, 4, 8, 16, 32, 64};

const std::array<Subject, 8> subjects = {{
    {"a grant and a release", "threads", 0, threadCounts, grantAndRelease},
    {"a serial section", "threads", 0, threadCounts, serialSection},
    {"all come and are let in", "waiters", 1, steps(1, 10'000), waiters},
    {"an inventory", "disks", 1, steps(1, 1000), disks},
    {"the mount table, parsed", "mounts", 1, steps(10, 10'000), mounts},
    {"all downloads, read", "rows", 1, steps(100, 100'000), downloads},
    {"a log, written", "entries", 1, steps(1000, 1'000'000), logEntries},
    {"a scan", "files", 1, steps(1000, 300'000), scannedFiles},
}};

/// The slope of the line through the upper half of the points, both axes logarithmic.
double exponentOf(const Curve& curve) {
  const double middle = std::sqrt(curve.points.front().x * curve.points.back().x);
  double count = 0, sumX = 0, sumY = 0, sumXX = 0, sumXY = 0;
  for (const auto& [countOf, cost] : curve.points) {
    if (countOf < middle) continue;
    const double x = std::log(countOf), y = std::log(cost);
    ++count;
    sumX += x;
    sumY += y;
    sumXX += x * x;
    sumXY += x * y;
  }
  return (count * sumXY - sumX * sumY) / (count * sumXX - sumX * sumX);
}

std::string timeText(Nanoseconds time) {
  constexpr std::array units = {"ns", "µs", "ms", "s"};
  std::size_t unit = 0;
  for (; time >= 999.5 && unit + 1 < units.size(); ++unit) time /= 1000;
  return fmt::format("{:.3g} {}", time, units[unit]);
}

std::string countText(double count) {
  return count >= 1e6   ? fmt::format("{:g}M", count / 1e6)
         : count >= 1e4 ? fmt::format("{:g}k", count / 1e3)
                        : fmt::format("{:g}", count);
}

/// Both axes are logarithmic, and have the whole decades as their grid.
void plot(Drawing& drawing, const Curve& curve, double exponent, Drawing::Point topLeft) {
  constexpr double width = 200, height = 140, ample = 1.02;
  const auto& points = curve.points;
  double least = points.front().y, greatest = least;
  for (const Drawing::Point& point : points) {
    least = std::min(least, point.y);
    greatest = std::max(greatest, point.y);
  }
  const double left = std::log10(points.front().x);
  const double right = std::log10(points.back().x);
  const double bottom = std::floor(std::log10(least));
  const double top = std::ceil(std::log10(greatest * ample));
  // From logarithms to places.
  const auto at = [&](double x, double y) {
    return Drawing::Point{topLeft.x + width * (x - left) / (right - left),
                          topLeft.y + height * (top - y) / (top - bottom)};
  };

  drawing.text({topLeft.x, topLeft.y - 10}, curve.subject.what);
  drawing.text({topLeft.x + width - 6, topLeft.y + height - 8},
               fmt::format("exponent {:.2f}", exponent), Drawing::Anchor::end);
  for (double y = bottom; y <= top; ++y) {
    drawing.line({at(left, y), at(right, y)}, Drawing::grid);
    const Drawing::Point place = at(left, y);
    drawing.text({place.x - 5, place.y + 4}, timeText(std::pow(10, y)), Drawing::Anchor::end);
  }
  const auto label = [&](double x) {
    const Drawing::Point place = at(x, bottom);
    drawing.text({place.x, place.y + 20}, countText(std::round(std::pow(10, x))),
                 Drawing::Anchor::middle);
  };
  for (double x = std::ceil(left); x <= right; ++x) {
    drawing.line({at(x, bottom), at(x, top)}, Drawing::grid);
    label(x);
  }
  if (right > std::floor(right)) label(right);
  drawing.text({topLeft.x + width, topLeft.y + height + 38}, curve.subject.of,
               Drawing::Anchor::end);
  drawing.line({at(left, top), at(left, bottom), at(right, bottom)}, Drawing::axis);

  // What is to be expected: the first cost for all, or growth to the last as far as there is room.
  const double slope = curve.subject.expected;
  const double end = std::log10(slope > 0 ? points.back().y : points.front().y);
  const double begin = slope > 0 ? std::max(left, right - (end - bottom) / slope) : left;
  drawing.line({at(begin, end - slope * (right - begin)), at(right, end)}, Drawing::comparison);
  std::vector<Drawing::Point> line;
  for (const auto& [count, cost] : points) line.push_back(at(std::log10(count), std::log10(cost)));
  drawing.line(line, Drawing::curve);
  for (const Drawing::Point& place : line) drawing.dot(place);
}

int run(const char* file) {
  constexpr double tolerance = 0.5;  // Half of what would be one dimension more.
  constexpr int columns = 3, panelWidth = 290, panelHeight = 220;
  constexpr int rows = (static_cast<int>(subjects.size()) + columns - 1) / columns;
  Drawing drawing(columns * panelWidth, rows * panelHeight);
  bool isGood = true;
  for (std::size_t i = 0; i < subjects.size(); ++i) {
    const Subject& subject = subjects[i];
    Curve curve{subject, {}};
    for (const int count : subject.counts)
      curve.points.push_back({static_cast<double>(count), subject.cost(count)});
    const double exponent = exponentOf(curve);
    const auto& first = curve.points.front();
    const auto& last = curve.points.back();
    fmt::print(
        "{:<26}  {:>5} to {:>5} {:<8}  {:>8} to {:>8}  exponent {:5.2f}, expected {:.0f}{}\n",
        subject.what, countText(first.x), countText(last.x), subject.of, timeText(first.y),
        timeText(last.y), exponent, subject.expected,
        exponent > subject.expected + tolerance ? "  GROWS TOO FAST" : "");
    isGood = isGood && exponent <= subject.expected + tolerance;
    const int column = static_cast<int>(i) % columns, row = static_cast<int>(i) / columns;
    plot(drawing, curve, exponent, {column * panelWidth + 62.0, row * panelHeight + 34.0});
  }
  if (file) drawing.write(file);
  return isGood ? EXIT_SUCCESS : EXIT_FAILURE;
}

}  // namespace
}  // namespace Varnel::Benchmarks

int main(int count, char** arguments) {
  return Varnel::Benchmarks::run(count > 1 ? arguments[1] : nullptr);
}

// SPDX-License-Identifier: MIT
// QtHost FILE: a window of Qt that reads a file under a session, and plans a reminder for tomorrow.
// With --once it says what it did and ends. Qt's loop may be GLib's or, with QT_NO_GLIB=1, its own.
#include <QAbstractEventDispatcher>
#include <QApplication>
#include <QLabel>
#include <QSocketNotifier>
#include <QString>
#include <cstdint>
#include <filesystem>
#include <iostream>
#include <memory>
#include <string>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskAccessingSession.h>
#include <Varnel/Platform/Ports/Application.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/NextDayCleanupReminderInfo.h>
#include <Varnel/Reminders/UserNotificationRouter.h>

using namespace Varnel;

namespace {

// Lets a loop that is not GLib's run the main queue. A GLib one does so by itself.
void runMainQueue(Platform::MainQueue& queue) {
  auto* loop = QAbstractEventDispatcher::instance();
  if (loop->inherits("QEventDispatcherGlib") || loop->inherits("QPAEventDispatcherGlib")) return;
  auto* notifier = new QSocketNotifier(*queue.descriptor(), QSocketNotifier::Read, loop);
  QObject::connect(notifier, &QSocketNotifier::activated, loop, [&queue] { queue.drain(); });
  QObject::connect(loop, &QAbstractEventDispatcher::aboutToBlock, loop, [&queue, loop] {
    // What the queue is to wait for changes; what is ready already wakes no poll.
    static_cast<void>(queue.descriptor());
    if (queue.drain()) loop->wakeUp();
  });
}

// On a thread of the framework's: the size of a file, in its turn on the disk; -1 when unreadable.
std::int64_t measure(const std::string& path) {
  const auto session = DiskAccessManager::shared().beginAccessingURL(
      Platform::URL::fileURLWithPath(path), "measuring");
  if (!session) return -1;
  std::error_code failed;
  const auto size = std::filesystem::file_size(path, failed);
  session->endAccessing();
  return failed ? -1 : static_cast<std::int64_t>(size);
}

}  // namespace

int main(int count, char** arguments) {
  const QApplication application(count, arguments);
  if (count < 2) return std::cerr << "QtHost FILE [--once]\n", 2;
  const std::string path = arguments[1];
  const bool isOnce = count > 2;
  const Platform::Ports& ports = Platform::processPorts();
  Platform::MainQueue& queue = ports.mainQueue;
  runMainQueue(queue);

  QObject::connect(&application, &QApplication::applicationStateChanged, [&](auto state) {
    ports.application.get().setActive(state == Qt::ApplicationActive);
  });
  UserNotificationRouter router;
  auto& center = router.userNotificationCenter();
  router.register_(NextDayCleanupReminderInfo::userNotificationIdentifier(),
                   [](const auto&, auto) { std::cout << "reminded" << std::endl; });

  QLabel label(QString::fromStdString("Reading " + path));
  label.setWindowTitle("Qt host");
  label.resize(480, 120);
  label.show();

  Basalt::globalConcurrentQueue()->execute([&, path] {
    const std::int64_t size = measure(path);
    queue.post([&, size] {
      const NextDayCleanupReminderInfo reminder(size, size);
      const bool isPlanned =
          size >= 0 && !center.scheduleNotification(reminder.makeUserNotification());
      label.setText(QString::number(size) + (isPlanned ? " bytes; see you tomorrow" : " bytes"));
      if (!isOnce) return;
      std::cout << (isPlanned ? "planned " : "not planned ") << label.text().toStdString() << " by "
                << QAbstractEventDispatcher::instance()->metaObject()->className() << std::endl;
      QApplication::exit(isPlanned ? 0 : 1);
    });
  });
  return QApplication::exec();
}

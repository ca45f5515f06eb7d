// SPDX-License-Identifier: MIT
#include <orvane/CommandLine.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <charconv>
#include <memory>
#include <string_view>
#include <utility>
#include <vector>

#include <Varnel/Context/BuildSwitches.h>
#include <orvane/AnalyticsCommand.h>
#include <orvane/DisksCommand.h>
#include <orvane/IdentifyCommand.h>
#include <orvane/LinkCommand.h>
#include <orvane/MenuCommand.h>
#include <orvane/OriginCommand.h>
#include <orvane/PathCommand.h>
#include <orvane/RemindCommands.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanCommand.h>
#include <orvane/SoundCommand.h>

namespace Orvane {
namespace {

using Varnel::Platform::QualityOfService;

void addLogFlag(CLI::App& app, Invocation& invocation) {
  app.add_flag("--log-to-stdout", invocation.logsToStandardOutput,
               "Print the log to standard output rather than standard error");
}

/// Adds a subcommand; when the arguments name it, the invocation runs the returned command.
template <typename Command>
std::pair<CLI::App*, std::shared_ptr<Command>> addCommand(CLI::App& app, Invocation& invocation,
                                                          const char* name,
                                                          const char* description) {
  auto command = std::make_shared<Command>();
  CLI::App* subcommand = app.add_subcommand(name, description);
  addLogFlag(*subcommand, invocation);
  subcommand->callback([command, &invocation] {
    invocation.command = [command](Console& console) { return command->run(console); };
  });
  return {subcommand, command};
}

QualityOfService qualityNamed(const std::string& name) {
  if (name == "background") return QualityOfService::background;
  if (name == "utility") return QualityOfService::utility;
  if (name == "user-initiated") return QualityOfService::userInitiated;
  if (name == "user-interactive") return QualityOfService::userInteractive;
  throw CLI::ValidationError("--qos", "there is no quality \"" + name + "\"");
}

void addScan(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<ScanCommand>(
      app, invocation, "scan",
      "Find the files of equal content, as 128-bit digests tell it, in folders and below them");
  options->add_option("FOLDER", command->folders, "The folders")
      ->type_name("")
      ->required()
      ->check([](const std::string& name) {
        return name.empty() ? std::string("the name of a folder is empty") : std::string();
      });
  options->add_flag("--json", command->isJSON, "Print one JSON object");
  options->add_flag("--progress", command->showsProgress,
                    "Show on the terminal how far the scan is");
  options->add_flag("--sound", command->playsSound, "Play a sound at the end");
  options
      ->add_option_function<std::string>(
          "--qos", [scan = command](const std::string& name) { scan->qos = qualityNamed(name); },
          "How urgent reading is: background, utility, user-initiated, user-interactive")
      ->type_name("QUALITY");
  options
      ->add_option("--analytics", command->analyticsEndpoint,
                   "Send events of the scan there, if the user consents")
      ->type_name("URL")
      ->check([](const std::string& text) {
        return ScanAnalytics::isEndpoint(text) ? std::string() : "\"" + text + "\" is no https URL";
      });
  options->add_flag("--print-events", command->printsEvents, "Show events in the log");
}

Tallyhouse::Consent answerNamed(const std::string& name) {
  if (name == "yes") return Tallyhouse::Consent::granted;
  if (name == "no") return Tallyhouse::Consent::refused;
  throw CLI::ValidationError("ANSWER", "the answer is yes or no, not \"" + name + "\"");
}

void addAnalytics(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<AnalyticsCommand>(
      app, invocation, "analytics", "Tell whether events of the scans may be sent");
  CLI::App* consent = options->add_subcommand("consent", "Tell it, or answer the question");
  addLogFlag(*consent, invocation);
  consent
      ->add_option_function<std::string>(
          "answer", [told = command](const std::string& name) { told->answer = answerNamed(name); },
          "yes or no; no also throws away what has not been sent")
      ->type_name("ANSWER");
}

void addDisks(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<DisksCommand>(
      app, invocation, "disks", "List the disks, their kinds, limits and volumes");
  options->add_flag("--json", command->isJSON, "Print one JSON object");
}

void addMenu(CLI::App& app, Invocation& invocation) {
  addCommand<MenuCommand>(app, invocation, "menu", "List the identifiers of the main menu's items");
}

void addPath(CLI::App& app, Invocation& invocation) {
  auto [options, command] =
      addCommand<PathCommand>(app, invocation, "path", "Show paths in their short form");
  options->add_option("paths", command->paths, "The paths; a folder's ends with a slash")
      ->type_name("PATH")
      ->required();
  options->add_flag("--expand", command->expands, "Show short forms in full");
}

Varnel::Sound::Case soundNamed(std::string_view name) {
  using Sound = Varnel::Sound::Case;
  static constexpr std::pair<std::string_view, Sound> sounds[] = {
      {"tutorial", Sound::tutorial},
      {"start", Sound::start},
      {"scan-complete", Sound::scanComplete},
      {"clean-complete", Sound::cleanComplete},
      {"achievement-notification", Sound::achievementNotification},
      {"rank-increased", Sound::rankIncreased},
      {"purchase", Sound::purchase},
  };
  for (const auto& [known, sound] : sounds)
    if (known == name) return sound;
  throw CLI::ValidationError("NAME", "there is no sound \"" + std::string(name) + "\"");
}

void addSound(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<SoundCommand>(app, invocation, "sound", "Play a sound");
  options
      ->add_option_function<std::string>(
          "name", [played = command](const std::string& name) { played->sound = soundNamed(name); },
          "tutorial, start, scan-complete, clean-complete, achievement-notification, "
          "rank-increased or purchase")
      ->type_name("NAME")
      ->required();
}

/// Rewrites the folders among the arguments of a scan so that the parser takes them as folders. It
/// would split "[a,b]" in two, treat "++" specially, and look for options behind a "--" that
/// follows a folder.
void protectFolders(std::vector<std::string>& arguments) {
  const auto command = std::find_if(arguments.begin(), arguments.end(), [](const auto& argument) {
    return !argument.starts_with('-');
  });
  if (command == arguments.end() || *command != "scan") return;
  const auto mark = std::find(command, arguments.end(), "--");
  for (auto argument = command; argument != arguments.end(); ++argument) {
    const bool isBehindMark = mark < argument && argument->starts_with('-');
    if (isBehindMark || *argument == "++" || argument->starts_with('[')) argument->insert(0, "./");
  }
  if (mark != arguments.end()) arguments.erase(mark);
}

Varnel::SchedulePeriodOption periodNamed(const std::string& name) {
  for (const auto period : Varnel::SchedulePeriodOption::optionsAvailableToUser())
    if (period.accessibilityIdentifier() == name) return period;
  throw CLI::ValidationError("PERIOD", "there is no period \"" + name + "\"");
}

// Digits and nothing else; the parser would wrap, cut, or take a leading zero for another base.
std::int64_t bytesIn(const char* option, const std::string& text) {
  std::int64_t count = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, status] = std::from_chars(text.data(), end, count);
  if (status == std::errc::invalid_argument || stop != end || text.starts_with('-'))
    throw CLI::ValidationError(option, "\"" + text + "\" is no count of bytes");
  if (status == std::errc::result_out_of_range)
    throw CLI::ValidationError(option, "\"" + text + "\" is more than there can be");
  return count;
}

void addByteCount(CLI::App& options, const char* name, std::int64_t& count,
                  const char* description) {
  options
      .add_option_function<std::string>(
          name, [name, &count](const std::string& text) { count = bytesIn(name, text); },
          description)
      ->type_name("BYTES")
      ->required();
}

void addRemind(CLI::App& app, Invocation& invocation) {
  CLI::App& remind = *app.add_subcommand("remind", "Remind the user to clean up");
  remind.require_subcommand(1);
  auto [everyOptions, every] = addCommand<RemindEveryCommand>(
      remind, invocation, "every", "Choose how often to remind the user");
  everyOptions
      ->add_option_function<std::string>(
          "period",
          [chosen = every](const std::string& name) { chosen->period = periodNamed(name); },
          "never, weekly, onceInTwoWeeks, monthly, onceInThreeMonths, onceInSixMonths or annually")
      ->type_name("PERIOD")
      ->required();
  addCommand<RemindStatusCommand>(remind, invocation, "status",
                                  "Tell the period and list the notifications");
  auto [tomorrowOptions, tomorrow] = addCommand<RemindTomorrowCommand>(
      remind, invocation, "tomorrow", "Remind the user tomorrow of what a scan has found");
  addByteCount(*tomorrowOptions, "--found", tomorrow->foundSize, "What the scan found, in bytes");
  addByteCount(*tomorrowOptions, "--selected", tomorrow->selectedSize,
               "What the user had selected, in bytes");
  addCommand<RemindListenCommand>(remind, invocation, "listen", "Show what happens to reminders");
}

void addOrigin(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<OriginCommand>(
      app, invocation, "origin", "Tell where this program, or a file, was downloaded from");
  options->add_option("file", command->file, "The file; this program when none is named")
      ->type_name("FILE");
  options->add_flag("--json", command->isJSON, "Print one JSON object");
}

void addIdentify(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<IdentifyCommand>(
      app, invocation, "identify", "Print what this installation is recognised by");
  options->add_flag("--json", command->isJSON, "Print one JSON object");
}

void addLink(CLI::App& app, Invocation& invocation) {
  auto [options, command] =
      addCommand<LinkCommand>(app, invocation, "link", "Print a link through the redirect service");
  options->add_option("--action", command->action, "What the service is asked for")
      ->type_name("ACTION");
  options->add_option("words", command->words, "A URL; with an action, parameters KEY=VALUE")
      ->type_name("");
}

}  // namespace

std::variant<Invocation, Information, UsageError> parseCommandLine(int count,
                                                                   const char* const* arguments) {
  Invocation invocation;
  CLI::App app("Finds duplicate files", "orvane");
  app.set_version_flag("--version", std::string("orvane ") + QNAppDisplayVersion());
  addLogFlag(app, invocation);
  app.require_subcommand(0, 1);
  addScan(app, invocation);
  addAnalytics(app, invocation);
  addDisks(app, invocation);
  addIdentify(app, invocation);
  addLink(app, invocation);
  addMenu(app, invocation);
  addOrigin(app, invocation);
  addPath(app, invocation);
  addRemind(app, invocation);
  addSound(app, invocation);
  std::vector<std::string> words(arguments + std::min(count, 1), arguments + count);
  protectFolders(words);
  std::reverse(words.begin(), words.end());  // as the parser wants them
  try {
    app.parse(std::move(words));
  } catch (const CLI::CallForHelp&) {
    return Information{app.help()};
  } catch (const CLI::CallForVersion&) {
    return Information{app.version() + "\n"};
  } catch (const CLI::ParseError& error) {
    return UsageError{error.what()};
  }
  if (!invocation.command) return UsageError{"a command is missing"};
  return invocation;
}

}  // namespace Orvane

// SPDX-License-Identifier: MIT
#include <orvane/CommandLine.h>

#include <CLI/CLI.hpp>
#include <map>
#include <memory>

#include <Varnel/Context/BuildSwitches.h>
#include <orvane/DisksCommand.h>
#include <orvane/ScanCommand.h>

namespace Orvane {
namespace {

using Varnel::Platform::QualityOfService;

/// Adds a subcommand; when the arguments name it, the invocation runs the returned command.
template <typename Command>
std::pair<CLI::App*, std::shared_ptr<Command>> addCommand(CLI::App& app, Invocation& invocation,
                                                          const char* name,
                                                          const char* description) {
  auto command = std::make_shared<Command>();
  CLI::App* subcommand = app.add_subcommand(name, description);
  subcommand->callback([command, &invocation] {
    invocation.command = [command](Console& console) { return command->run(console); };
  });
  return {subcommand, command};
}

void addScan(CLI::App& app, Invocation& invocation) {
  static const std::map<std::string, QualityOfService> qualities = {
      {"background", QualityOfService::background},
      {"utility", QualityOfService::utility},
      {"user-initiated", QualityOfService::userInitiated},
      {"user-interactive", QualityOfService::userInteractive},
  };
  auto [options, command] = addCommand<ScanCommand>(
      app, invocation, "scan", "Find the files of equal content in folders and below them");
  options->add_option("folders", command->folders, "The folders")
      ->type_name("FOLDER")
      ->required()
      ->check([](const std::string& name) {
        return name.empty() ? std::string("the name of a folder is empty") : std::string();
      });
  options->add_flag("--json", command->isJSON, "Print one JSON object");
  options->add_flag("--progress", command->showsProgress,
                    "Show on the terminal how far the scan is");
  options
      ->add_option("--qos", command->qos,
                   "How urgent reading is: background, utility, user-initiated, user-interactive")
      ->type_name("QUALITY")
      ->transform(CLI::CheckedTransformer(qualities).description(""));
}

void addDisks(CLI::App& app, Invocation& invocation) {
  auto [options, command] = addCommand<DisksCommand>(
      app, invocation, "disks", "List the disks, their kinds, limits and volumes");
  options->add_flag("--json", command->isJSON, "Print one JSON object");
}

}  // namespace

std::variant<Invocation, Information, UsageError> parseCommandLine(int count,
                                                                   const char* const* arguments) {
  Invocation invocation;
  CLI::App app("Finds duplicate files", "orvane");
  app.set_version_flag("--version", std::string("orvane ") + QNAppDisplayVersion());
  app.add_flag("--log-to-stdout", invocation.logsToStandardOutput,
               "Print the log to standard output rather than standard error");
  app.require_subcommand(1);
  addScan(app, invocation);
  addDisks(app, invocation);
  try {
    app.parse(count, arguments);
  } catch (const CLI::CallForHelp&) {
    return Information{app.help()};
  } catch (const CLI::CallForVersion&) {
    return Information{app.version() + "\n"};
  } catch (const CLI::ParseError& error) {
    return UsageError{error.what()};
  }
  return invocation;
}

}  // namespace Orvane

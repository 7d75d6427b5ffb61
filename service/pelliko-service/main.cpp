#include "Account.h"
#include "Commands.h"
#include "Service.h"
#include "UploadQueue.h"

#include <CLI/CLI.hpp>

#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <exception>

using namespace pelliko::service;

namespace
{
void addSettings(CLI::App &app, Settings &settings)
{
    const auto time = [&app](const char *name, int64_t &value, const char *text) {
        app.add_option(name, value, text)
            ->check(CLI::PositiveNumber)
            ->take_last()
            ->capture_default_str();
    };
    app.add_option("--queue", settings.queueFile, "The queue's file")->capture_default_str();
    app.add_option("--account-file", settings.accountFile, "The account's file")
        ->capture_default_str();
    time("--first-retry", settings.firstRetryMs, "First wait after a failed transfer (ms)");
    time("--longest-retry", settings.longestRetryMs, "Longest wait after a failed transfer (ms)");
    time("--give-up", settings.giveUpMs, "Time without success that ends a request (ms)");
    time("--chunk", settings.chunkBytes, "Most bytes of one append");
    app.add_option("--rate", settings.sendRate,
                   "Most bytes a second of one transfer, 0 for no limit")
        ->check(CLI::NonNegativeNumber)
        ->envname("PELLIKO_UPLOAD_RATE")
        ->capture_default_str();
    time("--stall", settings.stallSeconds, "Time without a byte that ends a transfer (s)");
    time("--first-launch-retry", settings.firstLaunchRetryMs,
         "First wait after a failed launch of the application (ms)");
    time("--longest-launch-retry", settings.longestLaunchRetryMs,
         "Longest wait after a failed launch (ms)");
    time("--claim", settings.claimMs, "Time to claim requests after a resume launch (ms)");
    time("--push-silence", settings.pushSilenceMs,
         "Silence after which the push stream is taken to be dead (ms)");
    time("--grace", settings.graceMs, "Time for living clients to come back after a start (ms)");
}

int runProgram(int argc, char **argv)
{
    CLI::App app{"Pelliko's background upload service. Without a subcommand it runs until it is "
                 "asked to end.",
                 "pelliko-service"};
    Settings settings;
    settings.queueFile = UploadQueue::defaultFile();
    settings.accountFile = pelliko::korrin::defaultAccountFile();
    addSettings(app, settings);

    Account typed;
    CLI::App *account =
        app.add_subcommand("account", "Write the account; the token is read from standard input");
    account->add_option("--server", typed.server, "Address of the share server")->required();
    account->add_option("--number", typed.number, "The user's own phone number")->required();
    account->add_option("--imsi", typed.imsi,
                        "IMSI of the SIM that the account belongs to; without it the "
                        "machine's SIM, else one made from the number");

    bool json = false;
    CLI::App *status = app.add_subcommand("status", "Print the requests of the running service");
    status->add_flag("--json", json, "Print JSON instead of a table");
    app.require_subcommand(0, 1);
    CLI11_PARSE(app, argc, argv);

    if (account->parsed()) {
        return accountCommand(settings.accountFile, typed);
    }
    if (status->parsed()) {
        return statusCommand(json);
    }
    return runService(settings);
}
} // namespace

int main(int argc, char **argv)
{
    std::setlocale(LC_ALL, "");
    try {
        return runProgram(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-service: %s\n", error.what());
        return EXIT_FAILURE;
    }
}

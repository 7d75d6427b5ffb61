// A look into the panel and a finger on it, for people and scripts.
#include <cstdio>
#include <iostream>
#include <stdexcept>

#include <CLI/CLI.hpp>

#include "Json.h"
#include "PanelCalls.h"
#include "Watch.h"

using namespace pelliko::quickpanel_tool;

namespace
{

struct Options {
    bool json = false;
    std::string app;
    std::string notification;
    int64_t since = -1;
    int count = 0;
};

void list(const Options &options)
{
    const auto all = postedNotifications(options.app);
    if (options.json) {
        std::cout << notificationsJson(all) << std::endl;
        return;
    }
    for (const auto &item : all)
        std::cout << notificationLine(item) << std::endl;
}

bool isOfInterest(const Event &event, const Options &options)
{
    return options.app.empty() || event.app == options.app;
}

void history(const Options &options)
{
    for (const auto &item : pastEvents()) {
        const Event event = eventOf(item);
        if (isOfInterest(event, options))
            std::cout << (options.json ? event.json : event.line) << std::endl;
    }
}

void watchEvents(const Options &options)
{
    int left = options.count;
    watch(options.since, [&](const Variant &item) {
        const Event event = eventOf(item);
        if (!isOfInterest(event, options))
            return true;
        // A watching script reads line by line.
        std::cout << event.json << std::endl;
        return options.count == 0 || --left > 0;
    });
}

void addList(CLI::App &tool, Options &options)
{
    auto *command = tool.add_subcommand("list", "What is posted, oldest first");
    command->add_flag("--json", options.json, "All fields, as one JSON array");
    command->add_option("--app", options.app, "Of this application only");
    command->callback([&] { list(options); });
}

void addFingers(CLI::App &tool, Options &options)
{
    const char *what = "Its tag, else its private id";
    auto *tapping = tool.add_subcommand("tap", "Tap on a notification");
    tapping->add_option("notification", options.notification, what)->required();
    tapping->add_option("--app", options.app, "Of this application only");
    tapping->callback([&] { tap(resolve(options.notification, options.app)); });
    auto *swiping = tool.add_subcommand("swipe", "Swipe a notification away");
    swiping->add_option("notification", options.notification, what)->required();
    swiping->add_option("--app", options.app, "Of this application only");
    swiping->callback([&] { swipe(resolve(options.notification, options.app)); });
}

void addEvents(CLI::App &tool, Options &options)
{
    auto *past = tool.add_subcommand("history", "What happened, oldest first");
    past->add_flag("--json", options.json, "All fields, one JSON object per line");
    past->add_option("--app", options.app, "Of this application only");
    past->callback([&] { history(options); });
    auto *live = tool.add_subcommand("watch", "What happens, one JSON object per line");
    live->add_option("--app", options.app, "Of this application only");
    live->add_option("--since", options.since,
                     "Begin with the remembered events after this \"seq\"; 0 for all of them")
        ->check(CLI::NonNegativeNumber);
    live->add_option("--count", options.count, "End after so many events")
        ->check(CLI::PositiveNumber);
    live->callback([&] { watchEvents(options); });
}

int runProgram(int argc, char **argv)
{
    CLI::App tool("Looks into the notification panel, taps and swipes.");
    tool.require_subcommand(1);
    Options options;
    addList(tool, options);
    addFingers(tool, options);
    addEvents(tool, options);
    CLI11_PARSE(tool, argc, argv);
    return EXIT_SUCCESS;
}

} // namespace

int main(int argc, char **argv)
{
    try {
        return runProgram(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "quickpanel-tool: %s\n", error.what());
        return EXIT_FAILURE;
    }
}

// velmora-log: shows the usage records that applications have kept, and stops or starts collecting.
#include <CLI/CLI.hpp>

#include "Commands.h"

using namespace pelliko::velmora;

namespace
{

ExitCode run(int argc, char **argv)
{
    CLI::App app{"Shows the usage records that applications keep on this machine, and switches "
                 "collecting off or on. Records never leave the machine."};
    app.require_subcommand(1);
    CLI::App *show_command = app.add_subcommand("show", "Print all records, oldest first.");
    bool as_json = false;
    show_command->add_flag("--json", as_json, "Print each record as its line of JSON");
    CLI::App *status_command =
        app.add_subcommand("status", "Tell whether records are collected, and how many there are.");
    CLI::App *off_command = app.add_subcommand(
        "off", "Stop collecting, for good. Records that are there stay until they are cleared.");
    CLI::App *on_command = app.add_subcommand("on", "Collect again.");
    app.add_subcommand("clear", "Take all records away.");
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? ExitCode::Success : ExitCode::Usage;
    }
    if (show_command->parsed())
        return show(as_json);
    if (status_command->parsed())
        return status();
    if (off_command->parsed() || on_command->parsed())
        return setCollecting(on_command->parsed());
    return clear();
}

} // namespace

int main(int argc, char **argv)
{
    try {
        return static_cast<int>(run(argc, argv));
    } catch (const std::exception &error) {
        std::cerr << "velmora-log: " << error.what() << '\n';
        return static_cast<int>(ExitCode::Failure);
    }
}

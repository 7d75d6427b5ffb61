// contacts-tool: imports, adds, lists and exports contacts.
#include <CLI/CLI.hpp>
#include <glib.h>

#include "Commands.h"

using namespace pelliko::contacts_tool;

namespace
{

// The vCard library warns about lines that it passes over; the import's own messages say what
// matters of it.
void silenceVcardLibrary()
{
    g_log_set_handler(
        "libebook-contacts", G_LOG_LEVEL_WARNING, [](auto...) {}, nullptr);
}

// What the command line said.
struct Arguments {
    std::string file;
    bool evolution = false;
    NewContact contact;
    bool as_json = false;
    std::vector<std::string> ids;
    bool one_file = false;
    std::string directory;
    Profile profile;
    ExitCode (*command)(const Arguments &) = nullptr;
};

// Makes the command the one to run when the command line names it.
void chooses(CLI::App *command, Arguments &arguments, ExitCode (*run)(const Arguments &))
{
    command->callback([&arguments, run] { arguments.command = run; });
}

void addImport(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand(
        "import", "Import vCards of a file, or the address books of Evolution. Cards that are "
                  "known already are updated; cards that cannot be read are named and skipped.");
    auto *source = command->add_option_group("source")->require_option(1);
    source->add_option("FILE", arguments.file, "File of vCards (.vcf)");
    source->add_flag("--evolution", arguments.evolution,
                     "The address books of Evolution Data Server");
    chooses(command, arguments, [](const Arguments &a) {
        return a.evolution ? importEvolution() : importFile(a.file);
    });
}

void addAdd(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand(
        "add",
        "Add a contact, or complete the one of that name and number, and print the number id.");
    NewContact &contact = arguments.contact;
    command->add_option("--name", contact.name, "Name that is shown")->required();
    command->add_option("--number", contact.number, "Phone number")->required();
    command->add_flag("--joined", contact.joined, "The number has joined the sharing service");
    command->add_option("--picture", contact.picture, "Image file; it is copied");
    chooses(command, arguments, [](const Arguments &a) { return add(a.contact); });
}

void addList(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand(
        "list", "List number id, name, number and whether the number has joined.");
    command->add_flag("--json", arguments.as_json, "Print a JSON array");
    chooses(command, arguments, [](const Arguments &a) { return list(a.as_json); });
}

void addExport(CLI::App &app, Arguments &arguments)
{
    CLI::App *command =
        app.add_subcommand("export", "Write contacts as vCards and print the files' names.");
    command->add_option("ID", arguments.ids, "Contact ids, as \"list\" shows them")->required();
    command->add_flag("--one-file", arguments.one_file, "All contacts in one file");
    command->add_option("--to", arguments.directory, "Directory of the new files")->required();
    chooses(command, arguments,
            [](const Arguments &a) { return exportContacts(a.ids, a.one_file, a.directory); });
}

void addProfile(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand("profile", "Your own card.");
    command->require_subcommand(1);
    CLI::App *set = command->add_subcommand("set", "Put it in place.");
    Profile &profile = arguments.profile;
    set->add_option("--name", profile.name, "Your name")->required();
    set->add_option("--number", profile.numbers, "Your phone number; may be repeated")->required();
    set->add_option("--picture", profile.picture, "Image file; it is copied");
    chooses(set, arguments, [](const Arguments &a) { return setProfile(a.profile); });
    CLI::App *show = command->add_subcommand("show", "Print it.");
    chooses(show, arguments, [](const Arguments &) { return showProfile(); });
}

int run(int argc, char **argv)
{
    CLI::App app{"Imports, adds, lists and exports the contacts that files can be shared with."};
    app.require_subcommand(1);
    Arguments arguments;
    for (auto *add_command : {addImport, addAdd, addList, addExport, addProfile})
        add_command(app, arguments);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? static_cast<int>(ExitCode::Success)
                                    : static_cast<int>(ExitCode::Usage);
    }
    silenceVcardLibrary();
    return static_cast<int>(arguments.command(arguments));
}

} // namespace

int main(int argc, char **argv)
{
    try {
        return run(argc, argv);
    } catch (const std::exception &error) {
        std::cerr << "contacts-tool: " << error.what() << '\n';
        return static_cast<int>(ExitCode::Failure);
    }
}

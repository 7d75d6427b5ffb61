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

int run(int argc, char **argv)
{
    CLI::App app{"Imports, adds, lists and exports the contacts that files can be shared with."};
    app.require_subcommand(1);

    std::string file;
    bool evolution = false;
    CLI::App *import_command = app.add_subcommand(
        "import", "Import vCards of a file, or the address books of Evolution. Cards that are "
                  "known already are updated; cards that cannot be read are named and skipped.");
    auto *source = import_command->add_option_group("source")->require_option(1);
    source->add_option("FILE", file, "File of vCards (.vcf)");
    source->add_flag("--evolution", evolution, "The address books of Evolution Data Server");

    NewContact contact;
    CLI::App *add_command = app.add_subcommand(
        "add",
        "Add a contact, or complete the one of that name and number, and print the number id.");
    add_command->add_option("--name", contact.name, "Name that is shown")->required();
    add_command->add_option("--number", contact.number, "Phone number")->required();
    add_command->add_flag("--joined", contact.joined, "The number has joined the sharing service");
    add_command->add_option("--picture", contact.picture, "Image file; it is copied");

    bool as_json = false;
    CLI::App *list_command = app.add_subcommand(
        "list", "List number id, name, number and whether the number has joined.");
    list_command->add_flag("--json", as_json, "Print a JSON array");

    std::vector<std::string> ids;
    bool one_file = false;
    std::string directory;
    CLI::App *export_command =
        app.add_subcommand("export", "Write contacts as vCards and print the files' names.");
    export_command->add_option("ID", ids, "Contact ids, as \"list\" shows them")->required();
    export_command->add_flag("--one-file", one_file, "All contacts in one file");
    export_command->add_option("--to", directory, "Directory of the new files")->required();

    Profile profile;
    CLI::App *profile_command = app.add_subcommand("profile", "Your own card.");
    profile_command->require_subcommand(1);
    CLI::App *set_command = profile_command->add_subcommand("set", "Put it in place.");
    set_command->add_option("--name", profile.name, "Your name")->required();
    set_command->add_option("--number", profile.numbers, "Your phone number; may be repeated")
        ->required();
    set_command->add_option("--picture", profile.picture, "Image file; it is copied");
    CLI::App *show_command = profile_command->add_subcommand("show", "Print it.");

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? static_cast<int>(ExitCode::Success)
                                    : static_cast<int>(ExitCode::Usage);
    }
    silenceVcardLibrary();
    if (import_command->parsed())
        return static_cast<int>(evolution ? importEvolution() : importFile(file));
    if (add_command->parsed())
        return static_cast<int>(add(contact));
    if (export_command->parsed())
        return static_cast<int>(exportContacts(ids, one_file, directory));
    if (set_command->parsed())
        return static_cast<int>(setProfile(profile));
    if (show_command->parsed())
        return static_cast<int>(showProfile());
    return static_cast<int>(list_command->parsed() ? list(as_json) : ExitCode::Usage);
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

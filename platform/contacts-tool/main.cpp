// contacts-tool: imports, adds and lists contacts.
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
    CLI::App app{"Imports, adds and lists the contacts that files can be shared with."};
    app.require_subcommand(1);

    std::string file;
    CLI::App *import_command = app.add_subcommand(
        "import",
        "Import the vCards of a file. Cards that are known already are updated; cards that "
        "cannot be read are named and skipped.");
    import_command->add_option("FILE", file, "File of vCards (.vcf)")->required();

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

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? static_cast<int>(ExitCode::Success)
                                    : static_cast<int>(ExitCode::Usage);
    }
    silenceVcardLibrary();
    if (import_command->parsed())
        return static_cast<int>(importFile(file));
    if (add_command->parsed())
        return static_cast<int>(add(contact));
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

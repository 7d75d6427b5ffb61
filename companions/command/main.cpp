// pelliko: shares files and text from a command line, and shows how the uploads stand.
#include "Contacts.h"
#include "Output.h"
#include "Sharing.h"
#include "Status.h"

#include <CLI/CLI.hpp>
#include <glib.h>

#include <clocale>
#include <functional>
#include <iostream>

using namespace pelliko::command;

namespace
{

constexpr const char *footer = R"(
Exit status: 0 done
             1 a file, the text or an upload failed
             2 the command line is wrong
             3 a recipient is not known, or could be several people
             4 Pelliko or its upload service cannot be reached

Examples:
  pelliko share photo.jpg notes.pdf --to "Anna Berg" --to +447700900106
  pelliko share photo.jpg               (asks for the recipients)
  date | pelliko text --to Anna
  pelliko status --follow)";

// What the command line said.
struct Arguments {
    std::vector<std::string> files;
    std::vector<std::string> words;
    std::vector<std::string> to;
    std::string search;
    bool json = false;
    bool follow = false;
    std::function<Exit()> run;
};

void addRecipients(CLI::App *command, Arguments &arguments)
{
    command
        ->add_option("--to", arguments.to,
                     "A recipient by name or phone number (repeatable); without any, a window asks")
        ->type_name("NAME_OR_NUMBER")
        ->allow_extra_args(false);
}

void addShare(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand(
        "share", "Share files; several are one share. Pelliko asks for consent before it sends.");
    command->add_option("FILE", arguments.files, "Files to share")->required()->type_name("");
    addRecipients(command, arguments);
    command->callback([&arguments] {
        arguments.run = [&arguments] { return shareFiles(arguments.files, arguments.to); };
    });
}

void addText(CLI::App &app, Arguments &arguments)
{
    CLI::App *command = app.add_subcommand("text", "Share a text.");
    command
        ->add_option("TEXT", arguments.words,
                     "The text; standard input is read without one and for \"-\"")
        ->type_name("");
    addRecipients(command, arguments);
    command->callback([&arguments] {
        arguments.run = [&arguments] { return shareText(arguments.words, arguments.to); };
    });
}

void addContacts(CLI::App &app, Arguments &arguments)
{
    CLI::App *command =
        app.add_subcommand("contacts", "List the people that something can be shared with.");
    command
        ->add_option("SEARCH", arguments.search, "Only those with this in the name or the number")
        ->type_name("");
    command->add_flag("--json", arguments.json, "Print a JSON array");
    command->callback([&arguments] {
        arguments.run = [&arguments] { return listContacts(arguments.search, arguments.json); };
    });
}

void addStatus(CLI::App &app, Arguments &arguments)
{
    CLI::App *command =
        app.add_subcommand("status", "Show how the uploads of the last 30 days stand.");
    command->add_flag("--follow", arguments.follow,
                      "Print each change until no upload is on its way any more");
    command->add_flag("--json", arguments.json,
                      "Print JSON: an array, or with --follow an object per line");
    command->callback([&arguments] {
        arguments.run = [&arguments] { return showStatus(arguments.follow, arguments.json); };
    });
}

// The library prints a mistake over several lines; people get one sentence.
Exit complain(const CLI::ParseError &mistake)
{
    const std::string sentence = mistake.what();
    return refuse(Exit::usage, sentence.substr(0, sentence.find('\n')) + " (see pelliko --help)");
}

Exit run(int argc, char **argv)
{
    CLI::App app("Shares files and text with people by phone number.", "pelliko");
    app.set_version_flag("--version", "pelliko " PELLIKO_VERSION);
    app.footer(footer);
    app.require_subcommand(1);
    Arguments arguments;
    for (auto *add : {addShare, addText, addContacts, addStatus})
        add(app, arguments);
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success &asked) {
        app.exit(asked);
        return finish();
    } catch (const CLI::ParseError &mistake) {
        return complain(mistake);
    }
    return arguments.run();
}

} // namespace

int main(int argc, char **argv)
{
    std::setlocale(LC_ALL, "");
    // What the libraries warn of the command tells itself, in its own words.
    g_log_set_default_handler([](auto...) {}, nullptr);
    try {
        return static_cast<int>(run(argc, argv));
    } catch (const std::exception &error) {
        return static_cast<int>(refuse(Exit::failed, error.what()));
    }
}

#include "AccountCommands.h"
#include "Config.h"
#include "Server.h"
#include "checking/CheckCommand.h"
#include "moving/MigrateCommand.h"
#include "store/OpenStores.h"

#include <CLI/CLI.hpp>
#include <systemd/sd-daemon.h>

#include <sys/stat.h>
#include <unistd.h>

#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace
{

namespace server = pelliko::server;

/// Where the data are, as it was asked for.
struct StoreOptions {
    std::string data;
    server::StoreUrls urls;

    [[nodiscard]] server::StoreUrls stores() const { return server::storeUrls(data, urls); }
};

struct AccountOptions {
    StoreOptions stores;
    std::string number;
    std::string name;
    server::InvitationOptions invitation;
    bool list = false;
    std::int64_t revoke = 0;
};

struct MigrateOptions {
    std::vector<std::string> from;
    std::vector<std::string> to;
};

struct CheckOptions {
    StoreOptions stores;
    bool mend = false;
};

struct ServeOptions {
    server::Config config;
    StoreOptions stores;
    long headTimeout = server::Timeouts{}.head.count();
    long idleTimeout = server::Timeouts{}.idle.count();
    long progressTimeout = server::Timeouts{}.progress.count();
    long drain = server::Config{}.drain.count();
};

void announce(const server::Server &server, int readyFd)
{
    std::fprintf(stderr, "pelliko-server: serving at %s\n", server.url().c_str());
    if (!server.monitoringUrl().empty())
        std::fprintf(stderr, "pelliko-server: monitored at %s\n", server.monitoringUrl().c_str());
    if (readyFd >= 0) {
        dprintf(readyFd, "%s\n", server.url().c_str());
        if (!server.monitoringUrl().empty())
            dprintf(readyFd, "%s\n", server.monitoringUrl().c_str());
        close(readyFd);
    }
    sd_notify(0, "READY=1");
}

int serve(const ServeOptions &options)
{
    server::Config config = options.config;
    config.stores = options.stores.stores();
    config.publicUrl = server::normalPublicUrl(config.publicUrl);
    config.timeouts.head = std::chrono::seconds(options.headTimeout);
    config.timeouts.idle = std::chrono::seconds(options.idleTimeout);
    config.timeouts.progress = std::chrono::seconds(options.progressTimeout);
    config.drain = std::chrono::seconds(options.drain);
    server::Stores stores = server::openStores(config.stores, server::Server::storageThreads);
    server::Server running(config, *stores.metadata, *stores.blobs, stores.now,
                           std::move(stores.peers));
    announce(running, config.readyFd);
    running.run();
    return EXIT_SUCCESS;
}

void addStores(CLI::App &command, StoreOptions &options)
{
    command.add_option("--data", options.data,
                       "Directory of everything the server keeps, as far as nothing else is given");
    command.add_option("--metadata", options.urls.metadata,
                       "What is known about shares: sqlite:PATH or postgresql://HOST/DATABASE");
    command.add_option("--blobs", options.urls.blobs,
                       "The bytes of files: dir:PATH or s3://HOST/BUCKET");
}

void addServe(CLI::App &app, ServeOptions &options)
{
    CLI::App *command = app.add_subcommand("serve", "Serve uploads, links and downloads");
    server::Limits &limits = options.config.limits;
    addStores(*command, options.stores);
    command->add_option("--listen", options.config.listen, "Address and port; port 0 picks one")
        ->capture_default_str();
    command->add_option("--public-url", options.config.publicUrl,
                        "What links start with; the listening address when absent");
    command->add_option("--share-lifetime", limits.shareLifetime, "Seconds from finish to expiry")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command
        ->add_option("--unfinished-lifetime", limits.unfinishedLifetime,
                     "Seconds until an unfinished share is given up")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command
        ->add_option("--keep-ended", limits.endedKept,
                     "Seconds for which an ended share is remembered")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command->add_option("--share-limit", limits.shareBytes, "Bytes in one share")
        ->capture_default_str();
    command->add_option("--daily-limit", limits.dailyBytes, "Bytes per account in 24 hours")
        ->capture_default_str();
    command
        ->add_option("--daily-numbers", limits.dailyNumbers,
                     "Numbers per account in 24 hours in questions about who has joined")
        ->capture_default_str();
    command
        ->add_option("--registration-limit", limits.registrations,
                     "Attempts to register from one address in an hour")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command
        ->add_option("--push-keepalive", limits.pushKeepAlive,
                     "Seconds between two signs of life on a push stream")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command->add_option("--head-timeout", options.headTimeout, "Seconds for a whole request head")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command->add_option("--idle-timeout", options.idleTimeout, "Seconds between two requests")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command
        ->add_option("--progress-timeout", options.progressTimeout,
                     "Seconds in which a body has to get on")
        ->check(CLI::PositiveNumber)
        ->capture_default_str();
    command
        ->add_option("--drain", options.drain,
                     "Seconds that requests in hand get to end once the server is asked to")
        ->check(CLI::NonNegativeNumber)
        ->capture_default_str();
    command->add_option(
        "--trusted-proxy", options.config.trustedProxies,
        "Address of a proxy on another machine that sets X-Forwarded-For; repeatable");
    command->add_option("--monitoring", options.config.monitoring,
                        "Address and port for /metrics, /readyz and /healthz; nowhere when absent");
    command->add_option(
        "--ready-fd", options.config.readyFd,
        "Descriptor that gets the server's address once it accepts connections, and a "
        "second line with the monitoring address if there is one");
    // The library reads a file only for the whole program: its [serve] section holds these options.
    app.set_config("--config", "", "File with options of serve, name = value under [serve]");
    app.allow_config_extras(CLI::config_extras_mode::error);
    command->fallthrough();
    command->footer("--config FILE reads these options from the file's section [serve].");
}

void addLifetime(CLI::App &command, server::InvitationOptions &options)
{
    const std::map<std::string, std::int64_t> units{{"s", 1}, {"m", 60}, {"h", 3600}, {"d", 86400}};
    command.add_option("--expires", options.lifetime, "How long the code works, like 12h or 7d")
        ->transform(CLI::AsNumberWithUnit(units))
        ->check(CLI::Range(std::int64_t{1}, std::int64_t{3650} * 86400))
        ->default_str("7d");
}

void addInvite(CLI::App &account, AccountOptions &options)
{
    CLI::App *invite = account.add_subcommand(
        "invite", "Make an invitation code and print it, once; list or revoke those there are");
    invite->add_option("--uses", options.invitation.uses, "Accounts that the code makes")
        ->check(CLI::Range(1, 100000))
        ->capture_default_str();
    addLifetime(*invite, options.invitation);
    CLI::Option *list = invite->add_flag(
        "--list", options.list, "Print id, creation, expiry (UTC), uses and the renewed number");
    invite->add_option("--revoke", options.revoke, "End the invitation with this id")
        ->excludes(list);
    CLI::App *renew = account.add_subcommand(
        "renew", "Make a code that moves an account to another phone, and print it, once");
    renew->add_option("--number", options.number, "Phone number of the account")->required();
    addLifetime(*renew, options.invitation);
    for (CLI::App *command : {invite, renew})
        addStores(*command, options.stores);
}

int runInvite(const AccountOptions &options)
{
    if (options.list)
        return server::listInvitationsCommand(options.stores.stores());
    if (options.revoke != 0)
        return server::revokeInvitationCommand(options.stores.stores(), options.revoke);
    return server::inviteCommand(options.stores.stores(), options.invitation);
}

void addAccount(CLI::App &app, AccountOptions &options)
{
    CLI::App *account = app.add_subcommand("account", "Manage the accounts that may share");
    account->require_subcommand(1);
    CLI::App *add = account->add_subcommand("add", "Make an account and print its token, once");
    CLI::App *list = account->add_subcommand("list", "Print number, creation time and name");
    CLI::App *remove = account->add_subcommand("remove", "Remove an account with all its shares");
    for (CLI::App *command : {add, list, remove})
        addStores(*command, options.stores);
    for (CLI::App *command : {add, remove})
        command->add_option("--number", options.number, "Phone number, like +4915112345678")
            ->required();
    add->add_option("--name", options.name, "Name, for the list");
    addInvite(*account, options);
}

void addMigrate(CLI::App &app, MigrateOptions &options)
{
    CLI::App *command = app.add_subcommand(
        "migrate", "Move the data to other stores; may be interrupted and given again");
    const std::string forms =
        ": a data directory, or addresses as --metadata and --blobs take them";
    command->add_option("--from", options.from, "Where the data are" + forms)->required();
    command
        ->add_option("--to", options.to,
                     "Where they go" + forms + "; what has no address here stays where it is")
        ->required();
    command->footer(
        "Files that are finished are copied while servers run. The rest needs them stopped: "
        "until then the command ends with status 2 and has to be given again.");
}

void addCheck(CLI::App &app, CheckOptions &options)
{
    CLI::App *command = app.add_subcommand(
        "check", "Compare what is known about files with the bytes that there are");
    addStores(*command, options.stores);
    command->add_flag("--mend", options.mend, "Put right what is found");
    command->footer(
        "Works beside servers that run. Ends with status 0 when everything is right or was "
        "mended, 1 when not, 2 when it could not look.");
}

int runCommand(const CLI::App &app, const ServeOptions &serveOptions,
               const AccountOptions &accountOptions, const MigrateOptions &migrateOptions,
               const CheckOptions &checkOptions)
{
    if (app.got_subcommand("serve"))
        return serve(serveOptions);
    if (app.got_subcommand("migrate"))
        return server::migrateCommand(migrateOptions.from, migrateOptions.to);
    if (app.got_subcommand("check"))
        return server::checkCommand(checkOptions.stores.stores(), checkOptions.mend);
    const CLI::App *account = app.get_subcommand("account");
    if (account->got_subcommand("add"))
        return server::addAccountCommand(accountOptions.stores.stores(), accountOptions.number,
                                         accountOptions.name);
    if (account->got_subcommand("invite"))
        return runInvite(accountOptions);
    if (account->got_subcommand("renew"))
        return server::renewAccountCommand(accountOptions.stores.stores(), accountOptions.number,
                                           accountOptions.invitation.lifetime);
    if (account->got_subcommand("remove"))
        return server::removeAccountCommand(accountOptions.stores.stores(), accountOptions.number);
    return server::listAccountsCommand(accountOptions.stores.stores());
}

int runProgram(int argc, char **argv)
{
    CLI::App app("Share server of Pelliko: resumable uploads, links with an end, downloads.");
    app.require_subcommand(1);
    ServeOptions serveOptions;
    AccountOptions accountOptions;
    addServe(app, serveOptions);
    MigrateOptions migrateOptions;
    CheckOptions checkOptions;
    addAccount(app, accountOptions);
    addMigrate(app, migrateOptions);
    addCheck(app, checkOptions);
    CLI11_PARSE(app, argc, argv);
    return runCommand(app, serveOptions, accountOptions, migrateOptions, checkOptions);
}

} // namespace

int main(int argc, char **argv)
{
    // Names in archives are written in the locale's encoding.
    std::setlocale(LC_CTYPE, "C.UTF-8");
    std::signal(SIGPIPE, SIG_IGN);
    // A limit on the size of files is one more way of having no space, not a reason to die.
    std::signal(SIGXFSZ, SIG_IGN);
    umask(077);
    try {
        return runProgram(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-server: %s\n", error.what());
        return EXIT_FAILURE;
    }
}

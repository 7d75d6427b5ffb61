#include "Frame.h"
#include "GlibPump.h"
#include "Readers.h"

#include <ApplicationId.h>
#include <FilesReceiver.h>
#include <Launcher.h>
#include <RequestReceiver.h>

#include <Elementary.h>
#include <app_control_delivery.h>
#include <dlog.h>
#include <gio/gio.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

using namespace pelliko::platform;

namespace
{

// How often a start looks again whether the running instance, which was just ending, is gone.
constexpr int kClaimAttempts = 10;

struct Start {
    std::vector<std::string> files;
    bool activatedByBus = false;
};

// Files as they are written on a command line, as absolute paths; options are the toolkit's affair.
std::vector<std::string> filesOf(int argc, char **argv)
{
    std::vector<std::string> files;
    for (int i = 1; i < argc; ++i) {
        if (argv[i][0] == '-')
            continue;
        g_autoptr(GFile) file = g_file_new_for_commandline_arg(argv[i]);
        g_autofree char *path = g_file_get_path(file);
        if (path)
            files.emplace_back(path);
    }
    return files;
}

Start readStart(int argc, char **argv)
{
    Start start{filesOf(argc, argv), std::getenv("DBUS_STARTER_BUS_TYPE") != nullptr};
    // Programs started from here were not started by the bus.
    unsetenv("DBUS_STARTER_BUS_TYPE");
    unsetenv("DBUS_STARTER_ADDRESS");
    return start;
}

void complain(const std::string &sentence)
{
    std::fprintf(stderr, "%s: %s\n", program_invocation_short_name, sentence.c_str());
    dlog_print(DLOG_ERROR, "APP", "%s", sentence.c_str());
}

HandOver handOverStart(const Start &start, std::string *error)
{
    // The bus starts a program for a request, and that request went to the instance that was
    // faster.
    if (start.activatedByBus && start.files.empty())
        return HandOver::Done;
    app_control_h request = requestForFiles(start.files);
    app_control_set_app_id(request, applicationId().c_str());
    const HandOver result = handOver(request, error);
    app_control_destroy(request);
    return result;
}

enum class Role { First, HandedOver, Failed };

// Files of a command line go where a desktop's go. First when that is this application itself.
Role passFilesOn(const Start &start)
{
    const std::string receiver =
        start.files.empty() ? applicationId() : receiverOfFiles(applicationId());
    if (receiver == applicationId())
        return Role::First;
    app_control_h request = requestForFiles(start.files);
    app_control_set_app_id(request, receiver.c_str());
    const int code = app_control_deliver_launch_request(request);
    app_control_destroy(request);
    if (code == APP_CONTROL_ERROR_NONE)
        return Role::HandedOver;
    complain(receiver + " cannot be started.");
    return Role::Failed;
}

// An instance that is leaving may own the name while it cannot take the request any more; the bus
// tells either way, so this goes on at once and without waiting.
Role findRole(RequestReceiver &receiver, const Start &start)
{
    std::string error;
    for (int attempt = 0; attempt < kClaimAttempts; ++attempt) {
        const RequestReceiver::Claim claim = receiver.claim(&error);
        if (claim == RequestReceiver::Claim::Owned)
            return Role::First;
        if (claim == RequestReceiver::Claim::NoBus) {
            complain("no session bus: " + error);
            return Role::Failed;
        }
        const HandOver result = handOverStart(start, &error);
        if (result == HandOver::Done)
            return Role::HandedOver;
        if (result == HandOver::Failed)
            break;
    }
    complain("the running instance cannot be reached: " + error);
    return Role::Failed;
}

void runLoop(RequestReceiver &receiver, const Start &start,
             const ui_app_lifecycle_callback_s &callbacks, void *userData)
{
    Readers readers;
    readers.whenKnown([&] {
        receiver.deliver(
            [&](app_control_h request) {
                if (callbacks.app_control)
                    callbacks.app_control(request, userData);
            },
            requestForFiles(start.files), !start.files.empty());
    });
    watchLanguage();
    elm_run();
    unwatchLanguage();
    receiver.close();
}

} // namespace

int ui_app_main(int argc, char **argv, ui_app_lifecycle_callback_s *callback, void *user_data)
{
    if (!callback || argc < 1 || !argv)
        return APP_ERROR_INVALID_PARAMETER;
    const Start start = readStart(argc, argv);
    installGlibPump();
    RequestReceiver receiver(applicationId());
    Role role = passFilesOn(start);
    if (role == Role::First)
        role = findRole(receiver, start);
    if (role != Role::First)
        return role == Role::HandedOver ? APP_ERROR_NONE : APP_ERROR_INVALID_CONTEXT;
    if (receiver.onlyPassedOn())
        return APP_ERROR_NONE;
    if (callback->create && !callback->create(user_data))
        return APP_ERROR_INVALID_CONTEXT;
    runLoop(receiver, start, *callback, user_data);
    if (callback->terminate)
        callback->terminate(user_data);
    return APP_ERROR_NONE;
}

void ui_app_exit(void)
{
    elm_exit();
}

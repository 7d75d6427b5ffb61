// Sends one launch request from a command line.
#include "Options.h"

#include <LaunchBus.h>
#include <Launcher.h>
#include <Serialisation.h>
#include <app_control.h>

#include <cstdio>
#include <map>

using namespace pelliko::applaunch;
using namespace pelliko::platform;

namespace
{

enum Status { kDone = 0, kNotDelivered = 1, kAnsweredFailed = 3, kNotAnswered = 4 };

void complain(const std::string &sentence)
{
    std::fprintf(stderr, "app-launch: %s\n", sentence.c_str());
}

const char *orNull(const std::string &text)
{
    return text.empty() ? nullptr : text.c_str();
}

bool accepted(int code, const std::string &key)
{
    if (code != APP_CONTROL_ERROR_NONE)
        complain("the extra data \"" + key + "\" is refused: " + get_error_message(code) + ".");
    return code == APP_CONTROL_ERROR_NONE;
}

bool addArrays(app_control_h request, const std::vector<Options::Pair> &elements)
{
    std::map<std::string, std::vector<const char *>> arrays;
    for (const auto &[key, value] : elements)
        arrays[key].push_back(value.c_str());
    for (auto &[key, values] : arrays) {
        const int code = app_control_add_extra_data_array(request, key.c_str(), values.data(),
                                                          static_cast<int>(values.size()));
        if (!accepted(code, key))
            return false;
    }
    return true;
}

bool fill(app_control_h request, const Options &options)
{
    app_control_set_app_id(request, options.app.c_str());
    app_control_set_operation(request, orNull(options.operation));
    app_control_set_mime(request, orNull(options.mime));
    app_control_set_uri(request, orNull(options.uri));
    for (const auto &[key, value] : options.extras) {
        if (!accepted(app_control_add_extra_data(request, key.c_str(), value.c_str()), key))
            return false;
    }
    return addArrays(request, options.arrayElements);
}

Status statusOf(app_control_result_e result)
{
    if (result == APP_CONTROL_RESULT_SUCCEEDED)
        return kDone;
    return result == APP_CONTROL_RESULT_FAILED ? kAnsweredFailed : kNotAnswered;
}

Status report(const LaunchOutcome &outcome, bool waitReply)
{
    if (!outcome.error.empty())
        complain("the application did not take the request: " + outcome.error + ".");
    if (!waitReply)
        return outcome.error.empty() ? kDone : kNotDelivered;
    std::printf("{\"result\":%d,\"extras\":%s}\n", outcome.result,
                extrasToJson(outcome.reply).c_str());
    return statusOf(outcome.result);
}

Status send(app_control_h request, const Options &options)
{
    Status status = kNotDelivered;
    GMainLoop *loop = g_main_loop_new(nullptr, FALSE);
    const int code = launch(request, options.waitReply, [&](const LaunchOutcome &outcome) {
        status = report(outcome, options.waitReply);
        g_main_loop_quit(loop);
    });
    if (code == APP_CONTROL_ERROR_NONE)
        g_main_loop_run(loop);
    else
        complain(options.app + " was not started: " + get_error_message(code) + ".");
    g_main_loop_unref(loop);
    return status;
}

} // namespace

int main(int argc, char **argv)
{
    Options options;
    int status = kDone;
    if (!readOptions(argc, argv, &options, &status))
        return status;
    // A bus that goes away is an answer like any other, not the end of this process.
    if (GDBusConnection *bus = sessionBus(nullptr))
        g_dbus_connection_set_exit_on_close(bus, FALSE);
    app_control_h request = nullptr;
    app_control_create(&request);
    status = fill(request, options) ? send(request, options) : kNotDelivered;
    app_control_destroy(request);
    return status;
}

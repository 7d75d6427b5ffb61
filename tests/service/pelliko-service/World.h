#pragma once

#include "Process.h"
#include "pelliko_client.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <optional>

/** One status report as it reached the test. */
struct SeenReport {
    int status = 0;
    std::optional<std::string> input;
    int percent = 0;
    int64_t expired = 0;
    int error = 0;
    int id = 0;
};

/** A launch that the application got. */
struct SeenLaunch {
    std::string operation;
    std::map<std::string, std::string> texts;
    std::map<std::string, std::vector<std::string>> lists;
    bool replyWanted = false;
};

/** One request that went through the proxy of a plan. */
struct SeenExchange {
    std::string request; ///< method and path
    std::string fault;   ///< empty: it passed
    int64_t at = 0;      ///< milliseconds, when its head was there
    int64_t bytes = 0;   ///< of its body that passed
};

/** The application's name on the bus, held by the test on a connection of its own; it records its
 * launches. */
class RecordingApplication
{
public:
    RecordingApplication();
    /** Ends: the name is gone afterwards. */
    ~RecordingApplication();
    RecordingApplication(const RecordingApplication &) = delete;
    RecordingApplication &operator=(const RecordingApplication &) = delete;

    std::vector<SeenLaunch> launches;
    bool resumes = true;    ///< answer a resume launch with "resume_by_app"
    bool confirms = true;   ///< return from a launch for messages or pushes
    int messagesResult = 0; ///< what a launch for messages is answered with
    std::function<void(const SeenLaunch &)> onLaunch;

private:
    static void onCall(GDBusConnection *, const char *, const char *, const char *, const char *,
                       GVariant *parameters, GDBusMethodInvocation *invocation, gpointer self);

    GDBusConnection *bus_;
    GDBusNodeInfo *node_;
};

/** A share server, an account and the service, all real, in a folder of their own. */
class World : public testing::Test
{
protected:
    World();
    ~World() override;

    void startServer();
    /** @param url what the account names; empty: the server itself */
    void makeAccount(const std::string &url = {});
    void startService(std::vector<std::string> options = {});
    /** A proxy before the server that stalls after so many bytes; the account then names the proxy.
     */
    void startProxy(int64_t stallAfter);
    /** A proxy before the server that does what the plan says (see tests/support/fault-proxy); the
     * account then names it. */
    void startFaults(const std::string &plan);
    /** What went through that proxy and is over, in order. */
    std::vector<SeenExchange> exchanges() const;

    /** Starts the service with a queue on a file system of its own. @return where that is seen from
     * outside */
    std::string smallDisk(int64_t bytes);

    std::string makeFile(const std::string &name, int64_t size);
    /** The queue is locked by another program, as by a backup, until that ends. */
    std::unique_ptr<Process> lockQueue();

    /** Asks for an upload to the two usual recipients. */
    int request(const std::vector<std::string> &files, int32_t *id, bool wifiOnly = false);
    /** The same to others: sender's country code, empty for none, and number. */
    int requestTo(const std::vector<std::pair<std::string, std::string>> &people,
                  const std::vector<std::string> &files, int32_t *id, bool wifiOnly = false);
    int reshare(int32_t earlier, int32_t *id);
    int resume(int32_t id);

    std::vector<SeenReport> reportsOf(int32_t id) const;
    std::vector<int> statusesOf(int32_t id) const; ///< without the percents, repeats removed
    bool waitForStatus(int32_t id, int status, int seconds = 30);
    bool waitForEnd(int32_t id, int seconds = 30);
    /** What the server answers on the path with the account's token. */
    std::string askServer(const std::string &method, const std::string &path);
    std::string downloadOf(const std::string &url);

    static void onReport(int status, const char *input, int percent, int64_t expired, int,
                         int error, int id, void *world);

    std::string folder_;
    std::string queueFolder_;          ///< where the service has its queue
    std::vector<std::string> wrapper_; ///< a command that the service is started by
    std::string token_;
    std::string serverUrl_ = "http://127.0.0.1:8091";
    std::unique_ptr<Process> server_;
    std::unique_ptr<Process> proxy_;
    std::unique_ptr<Process> service_;
    std::vector<SeenReport> reports_;
};

/** Waits until a bus name has an owner, or has none. */
bool waitForName(GBusType bus, const char *name, bool owned);

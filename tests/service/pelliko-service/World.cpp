#include "World.h"

#include <JsonValue.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <unistd.h>

namespace
{
constexpr const char *number = "+447700900100";
constexpr const char *serviceName = "com.velmora.pelliko.Service";

constexpr const char *operationSendText = "http://tizen.org/appcontrol/operation/send_text";
constexpr const char *applicationXml =
    "<node><interface name='com.velmora.Platform.Application1'><method name='Launch'>"
    "<arg name='request' type='a{sv}' direction='in'/><arg name='reply_wanted' type='b' "
    "direction='in'/>"
    "<arg name='result' type='i' direction='out'/><arg name='reply' type='a{sv}' direction='out'/>"
    "</method></interface></node>";

SeenLaunch readLaunch(GVariant *parameters)
{
    SeenLaunch launch;
    g_autoptr(GVariant) request = nullptr;
    gboolean replyWanted = FALSE;
    g_variant_get(parameters, "(@a{sv}b)", &request, &replyWanted);
    launch.replyWanted = replyWanted != FALSE;
    const char *operation = "";
    g_variant_lookup(request, "operation", "&s", &operation);
    launch.operation = operation;
    g_autoptr(GVariant) extras = g_variant_lookup_value(request, "extras", G_VARIANT_TYPE_VARDICT);
    GVariantIter iter;
    g_variant_iter_init(&iter, extras);
    const char *key = nullptr;
    GVariant *value = nullptr;
    while (g_variant_iter_loop(&iter, "{&sv}", &key, &value)) {
        if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING)) {
            launch.texts[key] = g_variant_get_string(value, nullptr);
        } else {
            g_autofree const char **texts = g_variant_get_strv(value, nullptr);
            for (const char **text = texts; *text; ++text) {
                launch.lists[key].emplace_back(*text);
            }
        }
    }
    return launch;
}

// The client library lives as long as the test program; what comes for an earlier test is dropped.
const void *currentWorld = nullptr;

// A service that the bus would start by itself knows nothing of the test's queue and account.
void stopActivation()
{
    const char *data = std::getenv("XDG_DATA_HOME");
    if (!std::filesystem::remove(std::string(data) + "/dbus-1/services/" + serviceName +
                                 ".service")) {
        return;
    }
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "ReloadConfig", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}

std::string program(const char *name)
{
    return std::string(PELLIKO_BUILD_DIR "/bin/") + name;
}
} // namespace

bool waitForName(GBusType bus, const char *name, bool owned)
{
    bool present = !owned;
    const guint watch = g_bus_watch_name(
        bus, name, G_BUS_NAME_WATCHER_FLAGS_NONE,
        [](GDBusConnection *, const char *, const char *, gpointer flag) {
            *static_cast<bool *>(flag) = true;
        },
        [](GDBusConnection *, const char *, gpointer flag) { *static_cast<bool *>(flag) = false; },
        &present, nullptr);
    const bool result = runUntil([&] { return present == owned; });
    g_bus_unwatch_name(watch);
    return result;
}

RecordingApplication::RecordingApplication()
    : node_(g_dbus_node_info_new_for_xml(applicationXml, nullptr))
{
    g_autofree char *address =
        g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    bus_ = g_dbus_connection_new_for_address_sync(
        address,
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, nullptr, nullptr);
    static const GDBusInterfaceVTable table{onCall, nullptr, nullptr, {}};
    g_dbus_connection_register_object(bus_, "/com/velmora/pelliko", node_->interfaces[0], &table,
                                      this, nullptr, nullptr);
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
        bus_, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "RequestName", g_variant_new("(su)", "com.velmora.pelliko", 4U), nullptr,
        G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}

RecordingApplication::~RecordingApplication()
{
    g_dbus_connection_close_sync(bus_, nullptr, nullptr);
    g_object_unref(bus_);
    g_dbus_node_info_unref(node_);
    waitForName(G_BUS_TYPE_SESSION, "com.velmora.pelliko", false);
}

void RecordingApplication::onCall(GDBusConnection *, const char *, const char *, const char *,
                                  const char *, GVariant *parameters,
                                  GDBusMethodInvocation *invocation, gpointer data)
{
    auto &self = *static_cast<RecordingApplication *>(data);
    const SeenLaunch launch = readLaunch(parameters);
    self.launches.push_back(launch);
    const bool messages = launch.operation == operationSendText;
    if ((messages || !launch.replyWanted) && !self.confirms) {
        return; // left open: the answer is lost when the connection ends
    }
    GVariantBuilder reply;
    g_variant_builder_init(&reply, G_VARIANT_TYPE_VARDICT);
    int result = 0;
    if (messages) {
        result = self.messagesResult;
    } else if (launch.replyWanted && self.resumes) {
        g_variant_builder_add(&reply, "{sv}", "resume_by_app", g_variant_new_string("1"));
    } else if (launch.replyWanted) {
        result = -2;
    }
    g_dbus_method_invocation_return_value(invocation, g_variant_new("(ia{sv})", result, &reply));
    if (self.onLaunch) {
        self.onLaunch(launch);
    }
}

World::World()
{
    std::string pattern = std::string(std::getenv("PELLIKO_STATE")) + "/uploads.XXXXXX";
    folder_ = mkdtemp(pattern.data());
    queueFolder_ = folder_;
    currentWorld = this;
    stopActivation();
}

World::~World()
{
    currentWorld = nullptr;
    if (service_) {
        service_->end(SIGTERM);
        waitForName(G_BUS_TYPE_SESSION, serviceName, false);
    }
}

void World::startServer()
{
    server_ = std::make_unique<Process>(
        std::vector<std::string>{program("pelliko-server"), "serve", "--listen", "127.0.0.1:8091",
                                 "--data", folder_ + "/server", "--ready-fd", "3"},
        true);
    ASSERT_TRUE(runUntil([this] { return !server_->lines().empty(); }));
    if (token_.empty()) {
        token_ = outputOf({program("pelliko-server"), "account", "add", "--data",
                           folder_ + "/server", "--number", number});
    }
}

void World::makeAccount(const std::string &url)
{
    outputOf({program("pelliko-service"), "--account-file", folder_ + "/account.json", "account",
              "--server", url.empty() ? serverUrl_ : url, "--number", number},
             token_ + "\n");
}

void World::startService(std::vector<std::string> options)
{
    std::vector<std::string> words = wrapper_;
    words.insert(words.end(), {program("pelliko-service"), "--queue", queueFolder_ + "/queue.db",
                               "--account-file", folder_ + "/account.json", "--first-retry", "100",
                               "--longest-retry", "400", "--first-launch-retry", "100",
                               "--longest-launch-retry", "400", "--claim", "700"});
    words.insert(words.end(), options.begin(), options.end());
    // The bus notices a killed owner a moment later; a call in between would go to the dead one.
    service_.reset();
    ASSERT_TRUE(waitForName(G_BUS_TYPE_SESSION, serviceName, false));
    service_ = std::make_unique<Process>(words);
    ASSERT_TRUE(waitForName(G_BUS_TYPE_SESSION, serviceName, true));
}

void World::startProxy(int64_t stallAfter)
{
    proxy_ = std::make_unique<Process>(std::vector<std::string>{
        "/usr/bin/python3", PELLIKO_SOURCE_DIR "/tests/service/pelliko-service/stalling-proxy",
        "8092", "8091", std::to_string(stallAfter)});
    ASSERT_TRUE(runUntil([this] { return !proxy_->lines().empty(); }));
    makeAccount("http://127.0.0.1:8092");
}

void World::startFaults(const std::string &plan)
{
    proxy_ = std::make_unique<Process>(std::vector<std::string>{
        "/usr/bin/python3", PELLIKO_SOURCE_DIR "/tests/support/fault-proxy", "8092", "8091", plan});
    ASSERT_TRUE(runUntil([this] { return !proxy_->lines().empty(); }));
    makeAccount("http://127.0.0.1:8092");
}

std::vector<SeenExchange> World::exchanges() const
{
    // It is read a line at a time, when the loop is free.
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    std::vector<SeenExchange> result;
    for (const std::string &line : proxy_->lines()) {
        if (line.front() == '{') {
            const auto seen = pelliko::test::JsonValue::parse(line);
            result.push_back({seen["method"].text() + " " + seen["path"].text(),
                              seen["fault"].text(), seen["at"].number(), seen["bytes"].number()});
        }
    }
    return result;
}

std::string World::smallDisk(int64_t bytes)
{
    queueFolder_ = folder_ + "/small";
    std::filesystem::create_directory(queueFolder_);
    wrapper_ = {"bwrap",   "--dev-bind", "/",
                "/",       "--size",     std::to_string(bytes),
                "--tmpfs", queueFolder_, "--die-with-parent"};
    startService();
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "GetConnectionUnixProcessID", g_variant_new("(s)", serviceName), nullptr,
        G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
    guint pid = 0;
    g_variant_get(reply, "(u)", &pid);
    return "/proc/" + std::to_string(pid) + "/root" + queueFolder_;
}

std::unique_ptr<Process> World::lockQueue()
{
    auto locker = std::make_unique<Process>(
        std::vector<std::string>{"/usr/bin/python3", "-c",
                                 "import sqlite3, sys, signal\n"
                                 "db = sqlite3.connect(sys.argv[1], isolation_level=None)\n"
                                 "db.execute('PRAGMA locking_mode = EXCLUSIVE')\n"
                                 "db.execute('BEGIN EXCLUSIVE')\n"
                                 "print('locked', flush=True)\n"
                                 "signal.pause()\n",
                                 folder_ + "/queue.db"});
    EXPECT_TRUE(runUntil([&] { return !locker->lines().empty(); }));
    return locker;
}

std::string World::makeFile(const std::string &name, int64_t size)
{
    const std::string path = folder_ + "/" + name;
    std::ofstream file(path, std::ios::binary);
    std::string block(65536, '\0');
    uint32_t state = static_cast<uint32_t>(size) ^ 0x9e3779b9U;
    for (int64_t written = 0; written < size;) {
        for (char &byte : block) {
            state = state * 1664525U + 1013904223U;
            byte = static_cast<char>(state >> 24U);
        }
        const auto part = std::min<int64_t>(size - written, static_cast<int64_t>(block.size()));
        file.write(block.data(), part);
        written += part;
    }
    return path;
}

int World::request(const std::vector<std::string> &files, int32_t *id, bool wifiOnly)
{
    return requestTo({{"44", "+447700900111"}, {"", "07700 900222"}}, files, id, wifiOnly);
}

int World::requestTo(const std::vector<std::pair<std::string, std::string>> &people,
                     const std::vector<std::string> &files, int32_t *id, bool wifiOnly)
{
    std::vector<pelliko_recipient_s> records;
    int32_t number_id = 11;
    for (const auto &[ccc, written] : people) {
        records.push_back({ccc.empty() ? nullptr : const_cast<char *>(ccc.c_str()),
                           const_cast<char *>(written.c_str()), number_id++, 0});
    }
    std::vector<pelliko_recipient_s *> recipients;
    for (pelliko_recipient_s &record : records) {
        recipients.push_back(&record);
    }
    recipients.push_back(nullptr); // as after an allocation that failed
    std::vector<char *> paths;
    for (const std::string &file : files) {
        paths.push_back(const_cast<char *>(file.c_str()));
    }
    const pelliko_upload_options_s options{1, 0};
    return pelliko_request_upload(&options, recipients.data(), static_cast<int>(recipients.size()),
                                  paths.data(), static_cast<int>(paths.size()), wifiOnly ? 1 : 0,
                                  onReport, this, id);
}

int World::reshare(int32_t earlier, int32_t *id)
{
    char third[] = "+447700900333";
    pelliko_recipient_s one{nullptr, third, 33, 0};
    pelliko_recipient_s *recipients[] = {&one};
    const pelliko_upload_options_s options{1, 0};
    return pelliko_request_reshare_upload(&options, recipients, 1, 0, onReport, this, earlier, id);
}

int World::resume(int32_t id)
{
    return pelliko_resume_upload_by_reboot(id, onReport, this);
}

void World::onReport(int status, const char *input, int percent, int64_t expired, int, int error,
                     int id, void *world)
{
    if (world != currentWorld) {
        return;
    }
    static_cast<World *>(world)->reports_.push_back(
        {status, input ? std::optional<std::string>(input) : std::nullopt, percent, expired, error,
         id});
}

std::vector<SeenReport> World::reportsOf(int32_t id) const
{
    std::vector<SeenReport> result;
    std::copy_if(reports_.begin(), reports_.end(), std::back_inserter(result),
                 [id](const SeenReport &report) { return report.id == id; });
    return result;
}

std::vector<int> World::statusesOf(int32_t id) const
{
    std::vector<int> result;
    for (const SeenReport &report : reportsOf(id)) {
        result.push_back(report.status);
    }
    result.erase(std::unique(result.begin(), result.end()), result.end());
    return result;
}

bool World::waitForStatus(int32_t id, int status, int seconds)
{
    return runUntil(
        [&] {
            const auto seen = reportsOf(id);
            return std::any_of(seen.begin(), seen.end(), [status](const SeenReport &report) {
                return report.status == status;
            });
        },
        seconds);
}

bool World::waitForEnd(int32_t id, int seconds)
{
    return runUntil(
        [&] {
            const auto seen = reportsOf(id);
            return !seen.empty() &&
                   (seen.back().error != 0 || seen.back().status == 5 || seen.back().status == 7);
        },
        seconds);
}

std::string World::askServer(const std::string &method, const std::string &path)
{
    return outputOf(
        {"curl", "-s", "-X", method, "-H", "Authorization: Bearer " + token_, serverUrl_ + path});
}

std::string World::downloadOf(const std::string &url)
{
    const std::string file = folder_ + "/download";
    outputOf({"curl", "-sf", "-o", file, url + "/0"});
    return file;
}

#include "Commands.h"

#include <kor_sim.h>

#include "com.velmora.pelliko.Service1.h"

#include <PhoneNumbers.h>
#include <nlohmann/json.hpp>

#include <cstdio>
#include <functional>
#include <iostream>

namespace pelliko::service
{
namespace
{
struct Row {
    gint32 id = 0;
    const char *state = "";
    gint32 percent = 0;
    gint32 files = 0;
    gint64 size = 0;
    gint64 expires = 0;
    gint32 error = 0;
};

// The state stays the variant's.
Row rowOf(GVariant *request)
{
    Row row;
    g_variant_lookup(request, "id", "i", &row.id);
    g_variant_lookup(request, "state", "&s", &row.state);
    g_variant_lookup(request, "percent", "i", &row.percent);
    g_variant_lookup(request, "files", "i", &row.files);
    g_variant_lookup(request, "size", "x", &row.size);
    g_variant_lookup(request, "expires", "x", &row.expires);
    g_variant_lookup(request, "error", "i", &row.error);
    return row;
}

struct RecipientRow {
    const char *number = "";
    const char *e164 = "";
    const char *fault = "";
    const char *joined = "";
};

// The texts stay the variant's.
RecipientRow recipientOf(GVariant *recipient)
{
    RecipientRow row;
    g_variant_lookup(recipient, "number", "&s", &row.number);
    g_variant_lookup(recipient, "e164", "&s", &row.e164);
    g_variant_lookup(recipient, "fault", "&s", &row.fault);
    g_variant_lookup(recipient, "joined", "&s", &row.joined);
    return row;
}

void forEachRecipient(GVariant *request, const std::function<void(const RecipientRow &)> &take)
{
    g_autoptr(GVariant) list =
        g_variant_lookup_value(request, "recipients", G_VARIANT_TYPE("aa{sv}"));
    for (gsize i = 0; list && i < g_variant_n_children(list); ++i) {
        g_autoptr(GVariant) recipient = g_variant_get_child_value(list, i);
        take(recipientOf(recipient));
    }
}

GVariant *askRequests()
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(PellikoService1) proxy = pelliko_service1_proxy_new_for_bus_sync(
        G_BUS_TYPE_SESSION, G_DBUS_PROXY_FLAGS_DO_NOT_LOAD_PROPERTIES,
        "com.velmora.pelliko.Service", "/com/velmora/pelliko/Service", nullptr, &error);
    GVariant *requests = nullptr;
    if (!proxy || !pelliko_service1_call_list_requests_sync(proxy, &requests, nullptr, &error)) {
        g_dbus_error_strip_remote_error(error);
        std::fprintf(stderr, "pelliko-service: the service does not answer: %s\n", error->message);
    }
    return requests;
}

void printTable(GVariant *requests)
{
    std::printf("%10s  %-10s %8s %6s %15s %6s\n", "ID", "STATE", "PERCENT", "FILES", "BYTES",
                "ERROR");
    for (gsize i = 0; i < g_variant_n_children(requests); ++i) {
        g_autoptr(GVariant) request = g_variant_get_child_value(requests, i);
        const Row row = rowOf(request);
        std::printf("%10d  %-10s %7d%% %6d %15" G_GINT64_FORMAT " %6d\n", row.id, row.state,
                    row.percent, row.files, row.size, row.error);
        forEachRecipient(request, [](const RecipientRow &recipient) {
            if (*recipient.fault) {
                std::printf("%12s%s gets nothing: %s\n", "", recipient.number,
                            numbers::faultSentence(recipient.fault));
            }
        });
    }
}

void printJson(GVariant *requests)
{
    nlohmann::json list = nlohmann::json::array();
    for (gsize i = 0; i < g_variant_n_children(requests); ++i) {
        g_autoptr(GVariant) request = g_variant_get_child_value(requests, i);
        const Row row = rowOf(request);
        nlohmann::json recipients = nlohmann::json::array();
        forEachRecipient(request, [&recipients](const RecipientRow &recipient) {
            recipients.push_back({{"number", recipient.number},
                                  {"e164", recipient.e164},
                                  {"fault", recipient.fault},
                                  {"joined", recipient.joined}});
        });
        list.push_back({{"id", row.id},
                        {"state", row.state},
                        {"percent", row.percent},
                        {"files", row.files},
                        {"size", row.size},
                        {"expires", row.expires},
                        {"error", row.error},
                        {"recipients", recipients}});
    }
    std::printf("%s\n", list.dump().c_str());
}
} // namespace

int accountCommand(const std::string &file, Account account)
{
    if (!std::getline(std::cin, account.token)) {
        std::fprintf(stderr, "pelliko-service: no token came on standard input\n");
        return 1;
    }
    if (account.imsi.empty()) {
        account.imsi = korrin::machineImsi();
    }
    if (account.imsi.empty()) {
        account.imsi = korrin::composedImsi(account.number);
    }
    const std::string fault = korrin::writeAccount(file, account);
    if (!fault.empty()) {
        std::fprintf(stderr, "pelliko-service: %s\n", fault.c_str());
        return 1;
    }
    return 0;
}

int statusCommand(bool json)
{
    g_autoptr(GVariant) requests = askRequests();
    if (!requests) {
        return 1;
    }
    if (json) {
        printJson(requests);
    } else {
        printTable(requests);
    }
    return 0;
}

} // namespace pelliko::service

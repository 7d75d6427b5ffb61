#pragma once

#include "PellikoApp/PushReceiver.h"
#include "PellikoApp/Workers.h"
#include "PellikoNotificationManager/NotificationBackup.h"
#include "support/AppWorld.h"
#include "support/ContactsStore.h"
#include "support/LaunchRequest.h"
#include "support/ReceivedSharesDouble.h"

#include <app_preference.h>
#include <contacts.h>
#include <glib.h>

namespace pelliko::test
{

/// Pushes about a few received shares, from senders of whom two are contacts.
class PushReceiver : public AppWorld
{
protected:
    static void SetUpTestSuite()
    {
        setenv("PELLIKO_APP_ID", "com.velmora.pelliko", 1);
        ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
        addPerson("Ann Example", {"+447700900001"}, "GIF89a Ann");
        addPerson("Bob Example", {"+447700900002"});
    }
    static void TearDownTestSuite() { contacts_disconnect(); }

    PushReceiver()
    {
        service.add("T1", {"+447700900001", {100, 200, 4000000000}});
        service.add("T2", {"+447700900002", {50}});
        service.add("T3", {"+447700900003", {7, 8}});
        service.add("Tnobody", {"", {1}});
    }
    // A push that a case has left under way must not reach the next one.
    ~PushReceiver() override
    {
        service.release();
        finishPushes();
        waitForWorkers(std::chrono::seconds(20));
        g_list_free_full(ad->push_info_list, g_free);
        ad->push_info_list = nullptr;
    }

    void push(const std::vector<std::string> &tokens)
    {
        LaunchRequest request;
        request.array("contents_token_list", tokens);
        receivePush(ad, request);
    }

    bool waitFor(const std::string &message)
    {
        return loop.runUntil([&] { return log.has(message); });
    }

    // Until the application asked to end.
    void pushAndWait(const std::vector<std::string> &tokens)
    {
        push(tokens);
        EXPECT_TRUE(waitFor(left)) << log.text();
    }

    std::vector<std::string> records() const
    {
        std::vector<std::string> all;
        for (const GList *at = ad->push_info_list; at; at = at->next)
            all.emplace_back(static_cast<const char *>(at->data));
        return all;
    }

    static std::string kept()
    {
        int count = -1;
        char *tokens = nullptr;
        preference_get_int(shareNotiBackupedKey, &count);
        preference_get_string(shareNotiTokensKey, &tokens);
        std::string text = std::to_string(count) + " " + (tokens ? tokens : "(none)");
        free(tokens);
        return text;
    }

    long times(const std::string &message) const
    {
        const auto all = log.messages();
        return std::count(all.begin(), all.end(), message);
    }

    std::string textOf(const char *text) const { return text ? text : "(null)"; }

    static constexpr const char *left = "No upload_data request id exist so app is exiting";
    ReceivedSharesDouble service;
};

} // namespace pelliko::test

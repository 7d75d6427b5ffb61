#include "PrivateStore.h"

#include <Ecore.h>

#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>

using testing::ElementsAre;

namespace
{

constexpr const char *kDone = "remote-share-settings-share_sms_done";

std::vector<std::string> heard;

void note(const std::string &who, const char *key, const void *data)
{
    int value = -1;
    preference_get_int(key, &value);
    heard.push_back(who + " " + static_cast<const char *>(data) + " " + std::to_string(value));
    EXPECT_TRUE(eina_main_loop_is());
}

void first(const char *key, void *data)
{
    note("first", key, data);
}

void second(const char *key, void *data)
{
    note("second", key, data);
}

void setAgain(const char *key, void *data)
{
    note("again", key, data);
    if (heard.size() == 1)
        preference_set_int(key, 2);
}

void *label(const char *text)
{
    return const_cast<char *>(text);
}

class Callbacks : public pelliko::test::PrivateStore
{
protected:
    Callbacks()
    {
        ecore_init();
        heard.clear();
    }
    ~Callbacks() override
    {
        turn();
        preference_unset_changed_cb(kDone);
        ecore_shutdown();
    }

    // Runs the loop until everything that was queued before has been dealt with.
    static void turn()
    {
        ecore_job_add([](void *) { ecore_main_loop_quit(); }, nullptr);
        ecore_main_loop_begin();
    }

    // Runs `work` on a worker, with the loop turning until it has ended and was heard of.
    template <typename Work> static void turnDuring(Work work)
    {
        std::thread worker([&] {
            work();
            ecore_main_loop_thread_safe_call_async([](void *) { ecore_main_loop_quit(); }, nullptr);
        });
        ecore_main_loop_begin();
        worker.join();
    }
};

} // namespace

TEST_F(Callbacks, ComeAfterTheSetFromTheLoop)
{
    preference_set_changed_cb(kDone, first, label("a"));
    preference_set_int(kDone, 1);
    EXPECT_TRUE(heard.empty());
    turn();
    EXPECT_THAT(heard, ElementsAre("first a 1"));
}

TEST_F(Callbacks, ComeOncePerSetAlsoForAnEqualValue)
{
    preference_set_changed_cb(kDone, first, label("a"));
    preference_set_int(kDone, 1);
    preference_set_int(kDone, 1);
    turn();
    preference_set_int(kDone, 1);
    turn();
    EXPECT_THAT(heard, ElementsAre("first a 1", "first a 1", "first a 1"));
}

TEST_F(Callbacks, RegisteringBeforeEveryWriteLosesNoSet)
{
    preference_set_changed_cb(kDone, first, label("a"));
    preference_set_int(kDone, 1);
    preference_set_changed_cb(kDone, first, label("b"));
    preference_set_int(kDone, 1);
    turn();
    EXPECT_THAT(heard, ElementsAre("first b 1", "first b 1"));
}

TEST_F(Callbacks, DoNotHearOfSetsBeforeTheirRegistration)
{
    preference_set_int(kDone, 0);
    preference_set_changed_cb(kDone, first, label("a"));
    turn();
    EXPECT_TRUE(heard.empty());
    preference_set_int(kDone, 1);
    preference_set_changed_cb(kDone, second, label("b"));
    turn();
    EXPECT_TRUE(heard.empty());
    preference_set_int(kDone, 2);
    turn();
    EXPECT_THAT(heard, ElementsAre("second b 2"));
}

TEST_F(Callbacks, StopWithUnsetAlsoForPendingSets)
{
    preference_set_changed_cb(kDone, first, label("a"));
    preference_set_int(kDone, 1);
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_unset_changed_cb(kDone));
    EXPECT_EQ(PREFERENCE_ERROR_NO_KEY, preference_unset_changed_cb(kDone));
    preference_set_changed_cb(kDone, first, label("b"));
    turn();
    EXPECT_TRUE(heard.empty());
}

TEST_F(Callbacks, AreNotCalledForOtherKeysRemovalsAndFailures)
{
    preference_set_changed_cb(kDone, first, label("a"));
    preference_set_int("other", 1);
    preference_set_string(kDone, nullptr);
    preference_set_int(kDone, 1);
    turn();
    heard.clear();
    preference_remove(kDone);
    preference_remove_all();
    turn();
    EXPECT_TRUE(heard.empty());
    preference_set_int(kDone, 5);
    turn();
    EXPECT_THAT(heard, ElementsAre("first a 5"));
}

TEST_F(Callbacks, MaySetTheKeyThemselves)
{
    preference_set_changed_cb(kDone, setAgain, label("a"));
    preference_set_int(kDone, 1);
    turn();
    turn();
    EXPECT_THAT(heard, ElementsAre("again a 1", "again a 2"));
}

TEST_F(Callbacks, OfAWorkersSetArriveOnTheMainLoop)
{
    turnDuring([] {
        preference_set_changed_cb(kDone, first, label("worker"));
        preference_set_int(kDone, 1);
        preference_set_int(kDone, 1);
    });
    EXPECT_THAT(heard, ElementsAre("first worker 1", "first worker 1"));
}

TEST_F(Callbacks, OfManyThreadsAreAllDelivered)
{
    constexpr int kThreads = 4;
    constexpr int kSets = 25;
    preference_set_changed_cb(kDone, first, label("x"));
    turnDuring([] {
        std::vector<std::thread> threads;
        for (int i = 0; i < kThreads; ++i) {
            threads.emplace_back([] {
                for (int set = 0; set < kSets; ++set)
                    preference_set_int(kDone, set);
            });
        }
        for (std::thread &thread : threads)
            thread.join();
    });
    EXPECT_EQ(std::size_t{kThreads} * kSets, heard.size());
}

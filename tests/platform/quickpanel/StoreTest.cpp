#include <csignal>
#include <filesystem>
#include <fstream>

#include <sys/resource.h>

#include <gtest/gtest.h>

#include "Store.h"

using namespace pelliko::quickpanel;

namespace
{

class PanelStore : public testing::Test
{
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/panel-XXXXXX";
        folder_ = mkdtemp(pattern);
        path_ = folder_ / "notifications.db";
    }
    void TearDown() override { std::filesystem::remove_all(folder_); }

    static Event post(const char *tag)
    {
        Event event;
        event.name = "post";
        event.record.app = "com.example.app";
        event.record.tag = tag;
        return event;
    }

    std::filesystem::path folder_;
    std::filesystem::path path_;
};

TEST_F(PanelStore, FindsAgainWhatAnEarlierRunPosted)
{
    int64_t id = 0;
    {
        Store store(path_);
        Event event = post("7");
        event.record.progress = 0.42;
        store.post(event);
        id = event.record.id;
        store.setDesktopId(id, {17, ":1.5"});
    }
    Store store(path_);
    const auto found = store.findByTag("com.example.app", "7");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->id, id);
    EXPECT_DOUBLE_EQ(found->progress, 0.42);
    EXPECT_EQ(store.desktopId(id).number, 17u);
    EXPECT_EQ(store.desktopId(id).owner, ":1.5");
}

TEST_F(PanelStore, AReplacementInheritsThePlaceOnTheDesktop)
{
    Store store(path_);
    Event first = post("7");
    store.post(first);
    store.setDesktopId(first.record.id, {17, ":1.5"});
    Event second = post("7");
    second.replaced = first.record.id;
    store.post(second);
    EXPECT_FALSE(store.find(first.record.id));
    EXPECT_EQ(store.desktopId(second.record.id).number, 17u);
    EXPECT_EQ(store.list("").size(), 1u);
}

TEST_F(PanelStore, AFailedPostLeavesNothingBehind)
{
    Store store(path_);
    Event first = post("7");
    store.post(first);
    Event second = post("7"); // the same tag without replacing
    EXPECT_ANY_THROW(store.post(second));
    EXPECT_EQ(store.list("").size(), 1u);
    EXPECT_EQ(store.history().size(), 1u);
}

TEST_F(PanelStore, TheHistoryIsBoundedAndItsNumbersGoOn)
{
    Store store(path_);
    for (int i = 0; i < Store::historyLength + 5; ++i) {
        Event event;
        event.name = "toast";
        event.message = std::to_string(i);
        store.append(event);
    }
    const auto events = store.history();
    ASSERT_EQ(events.size(), static_cast<size_t>(Store::historyLength));
    gint64 sequence = 0;
    ASSERT_TRUE(g_variant_lookup(events.front().get(), "seq", "x", &sequence));
    EXPECT_EQ(sequence, 6);
    const gchar *message = nullptr;
    ASSERT_TRUE(g_variant_lookup(events.front().get(), "message", "&s", &message));
    EXPECT_STREQ(message, "5");
}

TEST_F(PanelStore, AnUnreadableFileIsKeptAside)
{
    std::ofstream(path_) << "this is not a database, whatever its name says";
    Store store(path_);
    EXPECT_TRUE(store.list("").empty());
    EXPECT_TRUE(std::filesystem::exists(path_.string() + ".broken"));
}

TEST_F(PanelStore, AFileThatIsDamagedInsideIsKeptAsideToo)
{
    {
        Store store(path_);
        Event event = post("7");
        store.post(event);
    }
    std::fstream bytes(path_, std::ios::in | std::ios::out | std::ios::binary);
    bytes.seekp(4096);
    bytes << std::string(2000, 'x') << std::flush;
    Store store(path_);
    EXPECT_TRUE(store.list("").empty());
    EXPECT_TRUE(std::filesystem::exists(path_.string() + ".broken"));
    Event event = post("8");
    store.post(event);
    EXPECT_EQ(store.list("").size(), 1u);
}

TEST_F(PanelStore, AFullDiskRefusesAPostAndKeepsTheOthers)
{
    Store store(path_);
    Event first = post("7");
    store.post(first);
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    const rlimit nothing = {1, before.rlim_max};
    const auto handler = signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &nothing);
    Event second = post("8");
    EXPECT_ANY_THROW(store.post(second));
    setrlimit(RLIMIT_FSIZE, &before);
    signal(SIGXFSZ, handler);
    EXPECT_EQ(store.list("").size(), 1u);
    store.post(second); // there is room again
    EXPECT_EQ(store.list("").size(), 2u);
}

TEST_F(PanelStore, AFolderThatIsMissingIsAnError)
{
    EXPECT_ANY_THROW(Store(folder_ / "missing" / "notifications.db"));
}

} // namespace

#include <StateDir.h>
#include <vconf.h>

#include <climits>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <gio/gio.h>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using testing::ElementsAre;

namespace
{

constexpr const char *kNumber = "db/test/number";

std::vector<std::string> heard;

std::string describe(keynode_t *node)
{
    const char *text = vconf_keynode_get_str(node);
    return std::string(vconf_keynode_get_name(node)) + " " +
           std::to_string(vconf_keynode_get_bool(node)) + " " +
           std::to_string(vconf_keynode_get_int(node)) + " " + (text ? text : "-");
}

void listen(keynode_t *node, void *data)
{
    heard.push_back(static_cast<const char *>(data) + describe(node));
}

void listenToo(keynode_t *node, void *data)
{
    heard.push_back("too " + (static_cast<const char *>(data) + describe(node)));
}

void listenOnce(keynode_t *node, void *)
{
    heard.push_back("once");
    vconf_ignore_key_changed(vconf_keynode_get_name(node), listenOnce);
}

void *label(const char *text)
{
    return const_cast<char *>(text);
}

bool turnUntilHeard(std::size_t count)
{
    bool late = false;
    const guint timer = g_timeout_add_seconds(
        10,
        [](gpointer flag) -> gboolean {
            *static_cast<bool *>(flag) = true;
            return G_SOURCE_CONTINUE;
        },
        &late);
    while (heard.size() < count && !late)
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(timer);
    return heard.size() >= count;
}

class Vconf : public testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        std::string pattern = testing::TempDir() + "vconf-XXXXXX";
        folder = mkdtemp(pattern.data());
        setenv("XDG_DATA_HOME", (folder + "/data").c_str(), 1);
        setenv("XDG_RUNTIME_DIR", (folder + "/run").c_str(), 1);
    }
    static void TearDownTestSuite() { std::filesystem::remove_all(folder); }
    Vconf() { heard.clear(); }

    static std::string file(const std::string &key)
    {
        return pelliko::platform::stateDirectory() + "/vconf/" + key;
    }

    static std::string folder;
};

std::string Vconf::folder;

/// A session that says nothing of languages at first; the test's own comes back at the end.
class SessionLocale
{
public:
    SessionLocale()
    {
        for (const char *name : {"LC_ALL", "LC_MESSAGES", "LANG", "LANGUAGE"}) {
            const char *value = getenv(name);
            before_.emplace_back(name, value ? std::optional<std::string>(value) : std::nullopt);
            unsetenv(name);
        }
    }
    ~SessionLocale()
    {
        for (const auto &[name, value] : before_) {
            if (value)
                setenv(name.c_str(), value->c_str(), 1);
            else
                unsetenv(name.c_str());
        }
    }
    SessionLocale(const SessionLocale &) = delete;
    SessionLocale &operator=(const SessionLocale &) = delete;

    void say(const char *name, const char *value) const { setenv(name, value, 1); }

private:
    std::vector<std::pair<std::string, std::optional<std::string>>> before_;
};

} // namespace

TEST_F(Vconf, ValuesComeBackByTheirType)
{
    int number = 7;
    EXPECT_EQ(0, vconf_set_bool("db/test/flag", 4711));
    EXPECT_EQ(0, vconf_get_bool("db/test/flag", &number));
    EXPECT_EQ(1, number);
    EXPECT_EQ(0, vconf_set_int(kNumber, INT_MIN));
    EXPECT_EQ(0, vconf_get_int(kNumber, &number));
    EXPECT_EQ(INT_MIN, number);
    for (const std::string text : {"en_GB.UTF-8", "", "two\nlines\n", " int 5"}) {
        EXPECT_EQ(0, vconf_set_str("db/test/text", text.c_str()));
        char *read = vconf_get_str("db/test/text");
        EXPECT_EQ(text, read);
        free(read);
    }
}

TEST_F(Vconf, AnAbsentKeyAndAnotherTypeAreErrorsThatWriteNothing)
{
    int number = 7;
    vconf_set_str("db/test/text", "x");
    EXPECT_EQ(-1, vconf_get_bool("db/test/none", &number));
    EXPECT_EQ(-1, vconf_get_int("db/test/text", &number));
    EXPECT_EQ(-1, vconf_get_bool("db/test/text", &number));
    EXPECT_EQ(7, number);
    vconf_set_int(kNumber, 1);
    EXPECT_EQ(nullptr, vconf_get_str(kNumber));
    EXPECT_EQ(nullptr, vconf_get_str(nullptr));
    EXPECT_EQ(-1, vconf_get_int(nullptr, &number));
    EXPECT_EQ(-1, vconf_get_int(kNumber, nullptr));
    EXPECT_EQ(-1, vconf_set_str("db/test/text", nullptr));
}

TEST_F(Vconf, KeysCannotLeaveTheirFolder)
{
    for (const char *key : {"db/../x", "db//x", "/db/x", "x", "file/x", "db/", "db/.hidden", ""}) {
        EXPECT_EQ(-1, vconf_set_int(key, 1)) << key;
        EXPECT_EQ(-1, vconf_notify_key_changed(key, listen, nullptr)) << key;
    }
}

TEST_F(Vconf, MemoryKeysLieInTheRunTimeFolder)
{
    EXPECT_EQ(0, vconf_set_bool(VCONFKEY_TELEPHONY_READY, 1));
    EXPECT_TRUE(std::filesystem::exists(
        folder + "/run/pelliko-platform/vconf/memory/telephony/telephony_ready"));
    EXPECT_FALSE(std::filesystem::exists(file(VCONFKEY_TELEPHONY_READY)));
}

TEST_F(Vconf, DamagedFilesReadAsAbsent)
{
    int number = 7;
    vconf_set_int(kNumber, 1);
    for (const char *content :
         {"", "int", "int ", "int x", "int 5 6", "int 99999999999", "bool 2"}) {
        std::ofstream(file(kNumber)) << content;
        EXPECT_EQ(-1, vconf_get_int(kNumber, &number)) << content;
        EXPECT_EQ(-1, vconf_get_bool(kNumber, &number)) << content;
    }
    EXPECT_EQ(7, number);
}

TEST_F(Vconf, EverySetOfThisProcessIsHeardLater)
{
    ASSERT_EQ(0, vconf_notify_key_changed(kNumber, listen, label("a ")));
    EXPECT_EQ(-1, vconf_notify_key_changed(kNumber, listen, label("b ")));
    vconf_set_int(kNumber, 5);
    vconf_set_int(kNumber, 5);
    EXPECT_TRUE(heard.empty());
    EXPECT_TRUE(turnUntilHeard(2));
    EXPECT_EQ(0, vconf_ignore_key_changed(kNumber, listen));
    EXPECT_EQ(-1, vconf_ignore_key_changed(kNumber, listen));
    EXPECT_THAT(heard, ElementsAre("a db/test/number -1 5 -", "a db/test/number -1 5 -"));
}

TEST_F(Vconf, SetsOfAnotherProcessAreHeard)
{
    vconf_notify_key_changed(kNumber, listen, label(""));
    const std::string setter = std::string(PELLIKO_BUILD_DIR) + "/tests/key-setter";
    g_autoptr(GSubprocess) process =
        g_subprocess_new(G_SUBPROCESS_FLAGS_NONE, nullptr, setter.c_str(), kNumber, "8", nullptr);
    EXPECT_TRUE(turnUntilHeard(1));
    g_subprocess_wait(process, nullptr, nullptr);
    vconf_ignore_key_changed(kNumber, listen);
    EXPECT_THAT(heard, ElementsAre("db/test/number -1 8 -"));
}

TEST_F(Vconf, AFileWrittenByHandIsHeard)
{
    vconf_set_str(VCONFKEY_LANGSET, "en_GB.UTF-8");
    vconf_notify_key_changed(VCONFKEY_LANGSET, listen, label(""));
    std::ofstream(file(VCONFKEY_LANGSET)) << "string de_DE.UTF-8\n";
    EXPECT_TRUE(turnUntilHeard(1));
    vconf_ignore_key_changed(VCONFKEY_LANGSET, listen);
    EXPECT_THAT(heard, ElementsAre("db/menu_widget/language -1 -1 de_DE.UTF-8"));
    std::filesystem::remove(file(VCONFKEY_LANGSET));
}

TEST_F(Vconf, TheLanguageIsTheSessionsWhileNobodyHasSetOne)
{
    const SessionLocale locale;
    const auto language = [] {
        const std::unique_ptr<char, decltype(&free)> read(vconf_get_str(VCONFKEY_LANGSET), free);
        return std::string(read ? read.get() : "absent");
    };
    EXPECT_EQ("absent", language());
    locale.say("LANG", "fr_FR.UTF-8");
    EXPECT_EQ("fr_FR.UTF-8", language());
    locale.say("LC_MESSAGES", "pt_BR.utf8");
    EXPECT_EQ("pt_BR.UTF-8", language());
    locale.say("LC_ALL", "de_AT@euro");
    EXPECT_EQ("de_AT.UTF-8", language());
    for (const char *none : {"C", "POSIX", "C.UTF-8", "C.utf8"}) {
        locale.say("LC_ALL", none);
        EXPECT_EQ("absent", language()) << none;
    }
    locale.say("LC_ALL", "");
    EXPECT_EQ("pt_BR.UTF-8", language());
    ASSERT_EQ(0, vconf_set_str(VCONFKEY_LANGSET, "ja_JP.UTF-8"));
    EXPECT_EQ("ja_JP.UTF-8", language());
    std::filesystem::remove(file(VCONFKEY_LANGSET));
    EXPECT_EQ("pt_BR.UTF-8", language());
}

TEST_F(Vconf, TheFirstWishOfTheSessionGoesBeforeItsLocale)
{
    const SessionLocale locale;
    const auto language = [&](const char *wishes) {
        locale.say("LANGUAGE", wishes);
        const std::unique_ptr<char, decltype(&free)> read(vconf_get_str(VCONFKEY_LANGSET), free);
        return std::string(read ? read.get() : "absent");
    };
    // As for all texts of a session, the wish counts only beside a locale that is a language.
    EXPECT_EQ("absent", language("nl"));
    locale.say("LANG", "de_AT.UTF-8");
    EXPECT_EQ("nl.UTF-8", language("nl:de"));
    EXPECT_EQ("fr_CA.UTF-8", language("fr_CA.UTF-8:fr"));
    EXPECT_EQ("de_AT.UTF-8", language("de:en"));
    EXPECT_EQ("de_AT.UTF-8", language(""));
    EXPECT_EQ("de_AT.UTF-8", language(":en"));
}

TEST_F(Vconf, SeveralCallbacksOfAKeyAreAllCalledAndMayRemoveThemselves)
{
    const char *flag = "memory/test/flag";
    vconf_notify_key_changed(flag, listenOnce, nullptr);
    vconf_notify_key_changed(flag, listen, label("a "));
    vconf_notify_key_changed(flag, listenToo, label("b "));
    vconf_set_bool("memory/test/other", 1);
    vconf_set_bool(flag, 0);
    vconf_set_bool(flag, 1);
    EXPECT_TRUE(turnUntilHeard(5));
    vconf_ignore_key_changed(flag, listen);
    vconf_ignore_key_changed(flag, listenToo);
    // Both sets were made before the loop turned: each call reads the last value.
    EXPECT_THAT(heard,
                ElementsAre("once", "a memory/test/flag 1 -1 -", "too b memory/test/flag 1 -1 -",
                            "a memory/test/flag 1 -1 -", "too b memory/test/flag 1 -1 -"));
}

TEST_F(Vconf, IsReadOnAWorkerWhileItIsReplaced)
{
    constexpr int kRounds = 300;
    vconf_set_bool("memory/test/flag", 1);
    int failures = 0;
    std::thread reader([&] {
        for (int i = 0; i < kRounds; ++i) {
            int value = 0;
            failures += vconf_get_bool("memory/test/flag", &value) != 0 || value != 1;
        }
    });
    for (int i = 0; i < kRounds; ++i)
        vconf_set_bool("memory/test/flag", 1);
    reader.join();
    EXPECT_EQ(0, failures);
}

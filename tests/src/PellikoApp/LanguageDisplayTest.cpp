#include "PellikoApp/Language.h"

#include "PellikoApp/TextFormat.h"
#include "support/PopupScene.h"

#include <clocale>
#include <gmock/gmock.h>

namespace pelliko
{
namespace
{

using ::testing::ElementsAre;

constexpr const char *dir = "/opt/usr/apps/com.velmora.pelliko/res/locale";

class Language : public test::PopupScene
{
protected:
    Language() { log.restart(); }
    ~Language() override { setenv("LOCPATH", locales.c_str(), 1); }

    /// As on a desktop where nobody has chosen a language for the device.
    static void leaveItToTheSession(const char *locale)
    {
        const std::string state = getenv("XDG_DATA_HOME");
        std::filesystem::remove_all(state + "/pelliko-platform/vconf");
        unsetenv("LC_MESSAGES");
        unsetenv("LANGUAGE");
        setenv("LANG", locale, 1);
    }

    /// As on a machine that has no locale but C.UTF-8.
    static void loseLocales()
    {
        setlocale(LC_ALL, "C");
        setenv("LOCPATH", "/nowhere", 1);
    }

    const std::string locales = getenv("LOCPATH") ? getenv("LOCPATH") : "";
};

TEST_F(Language, DevicesLanguageIsApplied)
{
    speak("de_DE.UTF-8");
    EXPECT_STREQ(getenv("LANG"), "de_DE.UTF-8");
    EXPECT_STREQ(getenv("LC_MESSAGES"), "de_DE.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Teilen");
    EXPECT_THAT(log.messages(),
                ElementsAre("Current Lang : de_DE.UTF-8", "_initI18n setlocale = de_DE.UTF-8",
                            "_initI18n bindtextdomain domain = pelliko",
                            "_initI18n textdomain domain = pelliko"));
}

TEST_F(Language, WithoutAKeyItIsTheSessions)
{
    leaveItToTheSession("de_DE.UTF-8");
    _langChanged(nullptr, ad);
    EXPECT_STREQ(getenv("LC_MESSAGES"), "de_DE.UTF-8");
    EXPECT_EQ(log.messages().front(), "Current Lang : de_DE.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Teilen");
}

TEST_F(Language, WithoutAnyItIsBritishEnglishUnderTwoSpellings)
{
    leaveItToTheSession("C.UTF-8");
    _langChanged(nullptr, ad);
    EXPECT_STREQ(getenv("LANG"), "en_GB.utf8");
    EXPECT_STREQ(getenv("LC_MESSAGES"), "en_GB.utf8");
    EXPECT_EQ(log.messages().front(), "Current Lang : en_GB.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Share");
}

TEST_F(Language, TheSessionsLanguageListDoesNotWinOverTheDevices)
{
    setenv("LANGUAGE", "en", 1);
    speak("de_DE.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Teilen");
}

TEST_F(Language, OneWithoutALocaleFollowsAnother)
{
    speak("ar.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "مشاركة");
    EXPECT_TRUE(elm_config_mirrored_get());
    speak("ja.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "共有");
    EXPECT_FALSE(elm_config_mirrored_get());
    speak("he_IL.UTF-8");
    EXPECT_TRUE(elm_config_mirrored_get());
}

TEST_F(Language, UsersSeeTextsAlsoWhereNoLocaleIsInstalled)
{
    loseLocales();
    speak("de_DE.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Teilen");
    speak("en_GB.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Share");
    speak("sv_SE.UTF-8"); // no catalogue
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Share");
}

TEST_F(Language, TextsAreShownUnderAnInheritedPlainLocale)
{
    loseLocales();
    setenv("LC_ALL", "C", 1);
    speak("en_GB.UTF-8");
    EXPECT_STREQ(translated("IDS_RSH_BUTTON_SHARE_ABB5"), "Share");
    unsetenv("LC_ALL");
}

TEST_F(Language, GivenLocaleStandsInForABrokenEnvironment)
{
    setenv("LC_ALL", "xx_XX.UTF-8", 1);
    EXPECT_EQ(_initI18n("pelliko", dir, "de_DE.UTF-8"), 0);
    EXPECT_THAT(log.messages(), ElementsAre("_initI18n setlocale failed for the environment",
                                            "_initI18n setlocale = de_DE.UTF-8",
                                            "_initI18n bindtextdomain domain = pelliko",
                                            "_initI18n textdomain domain = pelliko"));
    unsetenv("LC_ALL");
}

TEST_F(Language, NoLocaleAtAllIsAFailure)
{
    setenv("LC_ALL", "xx_XX.UTF-8", 1);
    EXPECT_EQ(_initI18n("pelliko", dir, "yy_YY.UTF-8"), -1);
    EXPECT_THAT(log.messages(), ElementsAre("_initI18n setlocale failed for the environment"));
    unsetenv("LC_ALL");
}

TEST_F(Language, ChangeWithoutAPopupTouchesNoTexts)
{
    speak("de_DE.UTF-8");
    EXPECT_THAT(log.messages(), ::testing::Not(::testing::Contains(::testing::StartsWith("dget"))));
}

} // namespace
} // namespace pelliko

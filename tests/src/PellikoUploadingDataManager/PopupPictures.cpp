// Every popup in every state against the picture that a person found good.
#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "PellikoUploadingDataManager/StatusScene.h"

#include <array>
#include <cstdio>

namespace pelliko::test
{
namespace
{

constexpr const char *longName = "Maximiliana von Hohenstein-Wernigerode";

// Letters may be drawn a shade differently by another machine; a word that changed is more.
constexpr const char *fuzz = "15%";
constexpr int pixelsThatMayDiffer = 40;

// The number of pixels that differ; -1 when the pictures cannot be compared.
int differingPixels(const std::string &stored, const std::string &seen)
{
    FILE *pipe = popen(("compare -metric AE -fuzz " + std::string(fuzz) + " '" + stored + "' '" +
                        seen + "' null: 2>&1")
                           .c_str(),
                       "r");
    std::array<char, 200> said = {};
    const size_t length = pipe ? fread(said.data(), 1, said.size() - 1, pipe) : 0;
    const int result = pipe ? pclose(pipe) : -1;
    const bool compared = result == 0 || WEXITSTATUS(result) == 1;
    return compared && length > 0 ? static_cast<int>(atof(said.data())) : -1;
}

class PopupPictures : public StatusScene
{
protected:
    // What changed on purpose is stored by scripts/keep-pictures.
    void compare(const std::string &name)
    {
        photograph("popup-" + name);
        const std::string seen = PELLIKO_BUILD_DIR "/screenshots/popup-" + name + ".png";
        const std::string stored = PELLIKO_SOURCE_DIR
                                   "/tests/src/PellikoUploadingDataManager/pictures/popup-" +
                                   name + ".png";
        const int differing = differingPixels(stored, seen);
        EXPECT_GE(differing, 0) << stored << " and " << seen << " cannot be compared";
        EXPECT_LE(differing, pixelsThatMayDiffer) << seen << " is not " << stored;
    }

    void confirm(const std::string &name, int32_t action, const std::vector<Person> &people)
    {
        ad->action_type = action;
        share(3, 5 << 20, people);
        _createPopupView(ad);
        ASSERT_TRUE(settle(button("button2")));
        compare(name);
    }
};

TEST_F(PopupPictures, AskingAboutAShare)
{
    confirm("share-single", ACTION_UPLOAD, {{"Ann Example", true}});
    confirm("share-multiple", ACTION_UPLOAD, {{"Ann Example", true}, {longName}, {"Bo"}});
}

TEST_F(PopupPictures, AskingAboutAReshare)
{
    confirm("reshare-single", ACTION_RESHARE_UPLOAD, {{longName, true}});
    confirm("reshare-multiple", ACTION_RESHARE_UPLOAD, {{"Ann Example", true}, {"Bo"}});
}

class StatusPictures : public PopupPictures, public ::testing::WithParamInterface<int>
{
};

TEST_P(StatusPictures, OfOneRecipient)
{
    pending(45);
    tap({.state = GetParam(), .recipients = {"Ann Example+SMS"}, .files = 1, .bytes = 1572864});
    compare("status-single-" + std::to_string(GetParam()));
}

TEST_P(StatusPictures, OfSeveralRecipients)
{
    pending(100);
    tap({.state = GetParam(),
         .recipients = {"Ann Example+SMS", longName, "Bo+SMS", "Анна Каренина"},
         .files = 100,
         .bytes = 1023 << 20});
    compare("status-multiple-" + std::to_string(GetParam()));
}

INSTANTIATE_TEST_SUITE_P(States, StatusPictures, ::testing::Values(0, 1, 2, 3, 4, 5, 6, 8, 9));

} // namespace
} // namespace pelliko::test

#pragma once

#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "support/PopupScene.h"
#include "support/UploadServiceDouble.h"

#include <memory>

namespace pelliko::test
{

/// The popup on its own window, before a service that answers as it is told to.
class ConfirmationPopup : public PopupScene
{
protected:
    // One for all: the client remembers who stood on the bus.
    static void SetUpTestSuite()
    {
        PopupScene::SetUpTestSuite();
        double_ = std::make_unique<UploadServiceDouble>();
    }
    static void TearDownTestSuite() { double_.reset(); }

    ConfirmationPopup() { service.forget(); }
    ~ConfirmationPopup() override
    {
        if (ad->popup)
            evas_object_del(ad->popup);
    }

    void openPopup()
    {
        _createPopupView(ad);
        ASSERT_TRUE(settle(button("button2")));
    }

    bool closes()
    {
        return waitUntil([this] { return ad->popup == nullptr; });
    }

    bool isOnScreen() const { return ad->win && evas_object_visible_get(ad->win); }

    static inline std::unique_ptr<UploadServiceDouble> double_;
    UploadServiceDouble &service = *double_;

    /// Everything that hangs on the popup is forgotten with it.
    void expectNothingLeft() const
    {
        EXPECT_EQ(ad->popup, nullptr);
        EXPECT_EQ(ad->popup_layout, nullptr);
        EXPECT_EQ(ad->wifi_check_box, nullptr);
    }
};

} // namespace pelliko::test

#pragma once

#include "PellikoUploadManager/UploadStatus.h"
#include "PellikoUploadingDataManager/StatusPopup.h"
#include "PellikoUploadingDataManager/StatusScene.h"
#include "support/UploadServiceDouble.h"

#include <Elementary.h>
#include <memory>
#include <string>

namespace pelliko::test
{

/// The popup of a tapped upload, before a service that answers as it is told to.
class StatusPopup : public StatusScene
{
protected:
    static void SetUpTestSuite()
    {
        StatusScene::SetUpTestSuite();
        double_ = std::make_unique<UploadServiceDouble>();
    }
    static void TearDownTestSuite() { double_.reset(); }

    StatusPopup() { service.forget(); }

    std::string statusLine() const { return layoutText("elm.swallow.text"); }
    std::string sizeLine() const
    {
        const std::string line = layoutText("elm.swallow.text.bottom.left");
        return line == "(null)" ? "" : line;
    }
    double bar() const { return elm_progressbar_value_get(ad->progressbar); }
    bool isOnScreen() const { return ad->win && evas_object_visible_get(ad->win); }

    std::string heading() const { return layoutText("elm.swallow.label.text"); }

    bool closes()
    {
        return waitUntil([this] { return ad->popup == nullptr; });
    }

    void report(int status, int percent = 0, int error = 0, int request_id = 7)
    {
        uploadResponseStatusCb(status, nullptr, percent, 0, 0, error, request_id, ad);
    }

    void expectNoBarAndButton() const
    {
        EXPECT_EQ(ad->progressbar, nullptr);
        EXPECT_EQ(ad->cancel_button, nullptr);
        EXPECT_EQ(sizeLine(), "");
    }

    static inline std::unique_ptr<UploadServiceDouble> double_;
    UploadServiceDouble &service = *double_;
};

} // namespace pelliko::test

// The page of a received share.
#pragma once

#include "Saving.h"

#include <KeptShares.h>
#include <ListRow.h>
#include <Widgets.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::viewer
{

class SharePage
{
public:
    struct Wishes {
        std::function<void(size_t file)> file;
        std::function<void()> saveAll;
        std::function<void()> cancel;
        /// Asks the server once more.
        std::function<void()> tryAgain;
        std::function<void()> close;
    };

    /// Fills the page's column; what was there is gone.
    SharePage(const companion::Page &page, Wishes wishes);

    /// Nothing but words: while the server is asked, or when there is nothing to see.
    /// @param again whether trying once more may help
    void showWords(const std::string &words, bool waiting, bool again);

    /// The share. The files of one that is over are told, but cannot be saved.
    /// @param notice beside what the saving says; may be empty
    void showShare(const companion::ReceivedShare &share, const Saving &saving,
                   const std::string &notice, bool again);

private:
    enum class Actions { none, waiting, closing, tryAgain, save, cancel, saved };
    struct Row {
        SharePage *page = nullptr;
        size_t file = 0;
        companion::RowTexts texts;
        Evas_Object *button = nullptr;
    };

    void showActions(Actions actions);
    void addAction(const char *style, const char *text, Evas_Smart_Cb pressed);
    void showRows(const companion::ReceivedShare &share, const Saving &saving);
    void addRow(const companion::ShareFile &file, const companion::RowTexts &texts);
    static void onRow(void *row, Evas_Object *, void *);
    static void onSaveAll(void *page, Evas_Object *, void *);
    static void onCancel(void *page, Evas_Object *, void *);
    static void onTryAgain(void *page, Evas_Object *, void *);
    static void onClose(void *page, Evas_Object *, void *);

    Wishes wishes_;
    Actions shown_ = Actions::none;
    Evas_Object *title_ = nullptr;
    Evas_Object *summary_ = nullptr;
    Evas_Object *message_ = nullptr;
    Evas_Object *actions_ = nullptr;
    Evas_Object *progress_ = nullptr;
    Evas_Object *first_ = nullptr;
    Evas_Object *box_ = nullptr;
    std::vector<std::unique_ptr<Row>> rows_;
};

} // namespace pelliko::viewer

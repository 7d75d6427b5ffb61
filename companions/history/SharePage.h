// The page of one share, with all that can be done with it.
#pragma once

#include "ShareLists.h"

#include <Widgets.h>

#include <functional>
#include <string>
#include <vector>

namespace pelliko::history
{

class SharePage
{
public:
    struct Wishes {
        std::function<void()> shareAgain;
        std::function<void()> open;
        /// Asked and answered already.
        std::function<void()> withdraw;
        std::function<void()> forget;
        std::function<void()> back;
    };

    /// Fills the page's empty column.
    SharePage(const companion::Page &page, const SentShare &share, Wishes wishes);
    SharePage(const companion::Page &page, const ReceivedShare &share, Wishes wishes);

    /// Shows where the share stands now; false when the page no longer suits it and is to be made
    /// anew.
    bool update(const SentShare &share);
    bool update(const ReceivedShare &share);

    void showMessage(const std::string &sentence);

    /// Takes an open question back; false when there was none.
    bool dropQuestion();

private:
    void addHead(const std::string &title, const companion::Share &share, const std::string &state);
    void addActions();
    void addAction(const char *style, const char *text, Evas_Smart_Cb pressed);
    void addRecipients(const SentShare &share);
    void addFiles(const companion::Share &share);
    void addDate(const char *name, int64_t when);
    void ask(const std::string &question, const char *yes, std::function<void()> wish);
    static void onWithdraw(void *page, Evas_Object *, void *);
    static void onForget(void *page, Evas_Object *, void *);
    static void onYes(void *page, Evas_Object *, void *);
    static void onNo(void *page, Evas_Object *, void *);

    Wishes wishes_;
    /// What the page was made for: another one needs other actions.
    std::string made_;
    bool incomplete_ = false;
    bool sent_;
    Evas_Object *column_;
    Evas_Object *state_ = nullptr;
    Evas_Object *message_ = nullptr;
    Evas_Object *actions_ = nullptr;
    std::vector<Evas_Object *> buttons_;
    std::function<void()> asked_;
    bool shareable_ = false;
    bool withdrawable_ = false;
    bool forgettable_ = false;
};

} // namespace pelliko::history

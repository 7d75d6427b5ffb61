#include "SharePage.h"

#include "Words.h"

#include <Language.h>
#include <ListRow.h>
#include <Theme.h>

#include <utility>

namespace pelliko::history
{

using namespace companion;

namespace
{

constexpr int gap = 8;
constexpr size_t mostLines = 20;

// Whatever the page shows beside the state itself.
std::string shapeOf(const SentShare &share)
{
    std::string shape = std::to_string(share.state);
    for (const Recipient &recipient : share.recipients)
        shape += "/" + recipient.name + std::to_string(recipient.told);
    return shape;
}

std::string shapeOf(const ReceivedShare &share)
{
    return std::to_string(share.state) + "/" + share.sender;
}

bool isOnItsWay(const SentShare &share)
{
    return share.state == PELLIKO_SHARE_UPLOADING || share.state == PELLIKO_SHARE_PAUSED ||
           share.state == PELLIKO_SHARE_NOTIFYING;
}

} // namespace

SharePage::SharePage(const Page &page, const SentShare &share, Wishes wishes)
    : wishes_(std::move(wishes)), made_(shapeOf(share)), incomplete_(isOnItsWay(share)),
      sent_(true), column_(page.column), shareable_(isAvailable(share)),
      withdrawable_(isAvailable(share) || isOnItsWay(share)), forgettable_(hasEnded(share))
{
    addHead(recipientsText(share), share, stateText(share));
    addActions();
    addRecipients(share);
    addFiles(share);
    addDate(mark("Sent on"), share.created);
}

SharePage::SharePage(const Page &page, const ReceivedShare &share, Wishes wishes)
    : wishes_(std::move(wishes)), made_(shapeOf(share)), sent_(false), column_(page.column),
      forgettable_(true)
{
    addHead(senderText(share), share, stateText(share));
    addActions();
    if (!share.number.empty() && share.number != share.sender) {
        addText(column_, "name", mark("Phone number"));
        setText(addText(column_, "text", ""), share.number);
    }
    addFiles(share);
    addDate(mark("Sent on"), share.created);
}

void SharePage::addHead(const std::string &title, const Share &share, const std::string &state)
{
    setText(addText(column_, "title", ""), title);
    setText(addText(column_, "text", ""), contentText(share));
    state_ = addText(column_, "name", "");
    setText(state_, state);
    message_ = addPlace(column_);
    actions_ = elm_box_add(column_);
    elm_box_padding_set(actions_, 0, scaled(gap));
    append(column_, actions_);
}

void SharePage::addAction(const char *style, const char *text, Evas_Smart_Cb pressed)
{
    buttons_.push_back(addButton(actions_, style, text, pressed, this));
}

void SharePage::addActions()
{
    elm_box_clear(actions_);
    buttons_.clear();
    if (shareable_)
        addAction("popup/primary", mark("Share again"), [](void *page, Evas_Object *, void *) {
            static_cast<SharePage *>(page)->wishes_.shareAgain();
        });
    if (!sent_)
        addAction("popup/primary", mark("Open"), [](void *page, Evas_Object *, void *) {
            static_cast<SharePage *>(page)->wishes_.open();
        });
    if (withdrawable_)
        addAction("popup", mark("Withdraw"), onWithdraw);
    if (forgettable_)
        addAction("popup", mark("Remove from the list"), onForget);
    addAction("popup", mark("Back"), [](void *page, Evas_Object *, void *) {
        static_cast<SharePage *>(page)->wishes_.back();
    });
    elm_object_focus_set(buttons_.front(), EINA_TRUE);
}

void SharePage::addRecipients(const SentShare &share)
{
    addText(column_, "name", mark("Recipients"));
    for (size_t i = 0; i < share.recipients.size() && i < mostLines; ++i) {
        const Recipient &recipient = share.recipients[i];
        setText(addText(column_, "text", ""), recipient.name);
        const std::string number =
            recipient.name == recipient.number ? "" : recipient.number + ", ";
        setText(addText(column_, "note", ""), number + toldText(recipient));
    }
    if (share.recipients.size() > mostLines)
        setText(addText(column_, "note", ""),
                counted("and %d more", "and %d more", share.recipients.size() - mostLines));
}

void SharePage::addFiles(const Share &share)
{
    addText(column_, "name", mark("Files"));
    for (size_t i = 0; i < share.files.size() && i < mostLines; ++i)
        setText(addText(column_, "text", ""), share.files[i].name);
    if (share.files.size() > mostLines)
        setText(addText(column_, "note", ""),
                counted("and %d more", "and %d more", share.files.size() - mostLines));
}

void SharePage::addDate(const char *name, int64_t when)
{
    if (when <= 0)
        return;
    addText(column_, "name", name);
    setText(addText(column_, "text", ""), dateOf(when));
}

bool SharePage::update(const SentShare &share)
{
    if (made_ != shapeOf(share))
        return false;
    setText(state_, stateText(share));
    return true;
}

bool SharePage::update(const ReceivedShare &share)
{
    if (made_ != shapeOf(share))
        return false;
    setText(state_, stateText(share));
    return true;
}

void SharePage::showMessage(const std::string &sentence)
{
    setPlaceText(message_, "error", sentence);
}

void SharePage::ask(const std::string &question, const char *yes, std::function<void()> wish)
{
    asked_ = std::move(wish);
    showMessage(question);
    elm_box_clear(actions_);
    buttons_.clear();
    addAction("popup", yes, onYes);
    addAction("popup/primary", mark("No, go back"), onNo);
    // Whoever presses Return without reading changes nothing.
    elm_object_focus_set(buttons_.back(), EINA_TRUE);
}

bool SharePage::dropQuestion()
{
    if (!asked_)
        return false;
    asked_ = nullptr;
    showMessage({});
    addActions();
    return true;
}

void SharePage::onWithdraw(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<SharePage *>(data);
    page->ask(page->incomplete_
                  ? translated("Stop sending this share? Nobody will be able to open it.")
                  : translated("Withdraw this share? Its link ends for everybody. Files that "
                               "somebody has saved already stay with them."),
              mark("Withdraw"), page->wishes_.withdraw);
}

void SharePage::onForget(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<SharePage *>(data);
    std::string question;
    if (!page->sent_)
        question = translated("Remove this share? It cannot be opened again.");
    else if (page->shareable_)
        question = translated("Remove this share from the list? Its link stays until its end date, "
                              "and you can no longer withdraw it.");
    else
        question = translated("Remove this share from the list?");
    page->ask(question, mark("Remove"), page->wishes_.forget);
}

void SharePage::onYes(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<SharePage *>(data);
    const std::function<void()> wish = std::exchange(page->asked_, nullptr);
    page->showMessage({});
    page->addActions();
    if (wish)
        wish();
}

void SharePage::onNo(void *page, Evas_Object *, void *)
{
    static_cast<SharePage *>(page)->dropQuestion();
}

} // namespace pelliko::history

#include "PickWindow.h"

#include "Forwarding.h"
#include "TypedNumber.h"
#include "Words.h"

#include <Language.h>
#include <Search.h>
#include <dlog.h>
#include <efl_extension.h>

#include <algorithm>
#include <map>
#include <utility>

namespace pelliko::picker
{

using namespace companion;

namespace
{

constexpr const char *logTag = "PELLIKO_PICKER";

} // namespace

PickWindow::PickWindow(app_control_h request, std::function<void()> closed)
    : closed_(std::move(closed)), window_(addPage("pelliko-picker", mark("Share with"), -1.0)),
      content_(contentOf(request))
{
    app_control_clone(&request_, request);
    const auto leave = [](void *self, Evas_Object *, void *) {
        static_cast<PickWindow *>(self)->cancel();
    };
    evas_object_smart_callback_add(window_.window, "delete,request", leave, this);
    eext_object_event_callback_add(window_.column, EEXT_CALLBACK_BACK, leave, this);
    if (content_.kind != Content::Kind::nothing) {
        readContacts();
        chooseNamed();
        askWhatWasShared();
    }
    retell();
    evas_object_show(window_.window);
}

PickWindow::~PickWindow()
{
    pelliko_shares_stop(asking_);
    if (job_)
        ecore_job_del(job_);
    page_.reset();
    evas_object_del(window_.window);
    if (request_)
        app_control_destroy(request_);
}

void PickWindow::activate()
{
    elm_win_activate(window_.window);
}

void PickWindow::retell()
{
    elm_win_title_set(window_.window, translated(mark("Share with")));
    page_.reset();
    elm_box_clear(window_.column);
    if (content_.kind == Content::Kind::nothing)
        showNothing();
    else
        showPage();
}

void PickWindow::readContacts()
{
    model_.people.clear();
    std::vector<ContactNumber> numbers = contactNumbers(&model_.readable);
    std::map<std::string, int> numbersOf;
    for (const ContactNumber &number : numbers)
        ++numbersOf[number.name];
    for (ContactNumber &number : numbers) {
        const bool several = numbersOf[number.name] > 1;
        PersonList::Line line{std::move(number), several};
        line.folded = foldedText(line.person.name);
        line.digits = digitsOf(line.person.number);
        model_.people.push_back(std::make_shared<PersonList::Line>(std::move(line)));
    }
    model_.homeCode = homeCode();
}

// A request may know some of its recipients already.
void PickWindow::chooseNamed()
{
    for (const int32_t id : recipientsOf(request_)) {
        const auto found = std::find_if(model_.people.begin(), model_.people.end(),
                                        [id](const auto &line) { return line->person.id == id; });
        if (found != model_.people.end() && !model_.choice.has((*found)->person))
            model_.choice.toggle((*found)->person);
    }
}

// The request only has the number of an earlier share; the service knows its files.
void PickWindow::askWhatWasShared()
{
    if (content_.kind == Content::Kind::again)
        pelliko_shares_list_sent(onListed, this, &asking_);
}

void PickWindow::onListed(int result, const pelliko_sent_share_s *shares, int count, void *data)
{
    auto *self = static_cast<PickWindow *>(data);
    self->asking_ = 0;
    for (int i = 0; result == 0 && i < count; ++i) {
        if (shares[i].request_id != self->content_.request)
            continue;
        for (int file = 0; file < shares[i].file_count; ++file)
            self->content_.names.emplace_back(shares[i].files[file].name);
    }
    self->page_->showContent(contentText(self->content_));
}

void PickWindow::showPage()
{
    page_ = std::make_unique<PickPage>(
        window_, model_,
        PickPage::Wishes{[this] { share(); }, [this] { cancel(); }, [this] { againLater(); }});
    page_->showContent(contentText(content_));
}

void PickWindow::showNothing()
{
    addText(window_.column, "title", mark("Share with"));
    addText(window_.column, "text",
            mark("There is nothing to share here. Choose files in another application and share "
                 "them from there."));
    Evas_Object *button = addButton(
        window_.column, "popup/primary", mark("Close"),
        [](void *self, Evas_Object *, void *) {
            static_cast<PickWindow *>(self)->finish(APP_CONTROL_RESULT_FAILED);
        },
        this);
    elm_object_focus_set(button, EINA_TRUE);
}

// The page is in the middle of a call when it is told to come again.
void PickWindow::againLater()
{
    if (!job_)
        job_ = ecore_job_add(onAgain, this);
}

void PickWindow::onAgain(void *data)
{
    auto *self = static_cast<PickWindow *>(data);
    self->job_ = nullptr;
    useContacts();
    self->readContacts();
    self->retell();
}

// Nothing at all when one of them cannot be kept: the share would go to some of the chosen only.
std::vector<int32_t> PickWindow::numberIds() const
{
    std::vector<int32_t> ids;
    for (const ContactNumber &person : model_.choice.people()) {
        const int32_t id = person.id != 0 ? person.id : numberIdFor(person.number);
        if (id == 0)
            return {};
        if (std::find(ids.begin(), ids.end(), id) == ids.end())
            ids.push_back(id);
    }
    return ids;
}

void PickWindow::share()
{
    if (sharing_)
        return;
    const std::vector<int32_t> ids = numberIds();
    if (ids.empty()) {
        page_->showMessage(translated("The number cannot be kept on this device. Make room on it "
                                      "and try again."));
        return;
    }
    dlog_print(DLOG_INFO, logTag, "shared with %zu number(s)", ids.size());
    sharing_ = true;
    const auto done = [](int result, void *self) {
        static_cast<PickWindow *>(self)->taken(result);
    };
    if (const int result = shareWith(request_, ids, done, this); result != 0)
        taken(result);
}

void PickWindow::taken(int result)
{
    sharing_ = false;
    if (result == 0) {
        finish(APP_CONTROL_RESULT_SUCCEEDED);
        return;
    }
    dlog_print(DLOG_ERROR, logTag, "the application did not take the request: %d", result);
    page_->showMessage(translated("Pelliko could not be started."));
    evas_object_show(window_.window);
}

// A request that is on its way is not taken back.
void PickWindow::cancel()
{
    if (sharing_)
        evas_object_hide(window_.window);
    else
        finish(APP_CONTROL_RESULT_CANCELED);
}

void PickWindow::finish(app_control_result_e result)
{
    if (!request_)
        return;
    answer(request_, result);
    app_control_destroy(std::exchange(request_, nullptr));
    evas_object_hide(window_.window);
    closed_();
}

} // namespace pelliko::picker

// Contacts shared through the dispatcher, with the real store, worker, window and popups.
#include "PellikoApp/ContactVcard.h"

#include "PellikoApp/Dispatch.h"
#include "support/LaunchRequest.h"
#include "support/PopupScene.h"

#include <ContactsWriter.h>
#include <MyProfile.h>
#include <contacts.h>
#include <cstring>
#include <fstream>
#include <gmock/gmock.h>
#include <iterator>
#include <mutex>
#include <set>

namespace pelliko
{
namespace
{

using test::LaunchRequest;
using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char *contactMime = "application/vnd.tizen.contact";
constexpr const char *oneFileKey = "db/contacts-svc/share_multiple_contacts_as_one_file";
const std::string directory = "/opt/usr/apps/com.velmora.pelliko/shared/data/";
constexpr const char *exits = "No upload_data request id exist so app is exiting";

class ContactVcard : public test::PopupScene
{
protected:
    static void SetUpTestSuite()
    {
        PopupScene::SetUpTestSuite();
        contacts_connect();
        auto writer = contacts::ContactsWriter::open();
        std::vector<contacts::ContactCard> cards(150);
        for (size_t i = 0; i < cards.size(); ++i) {
            cards[i].display_name = "Person " + std::to_string(i + 1);
            cards[i].name_source = contacts::NameSource::Name;
            cards[i].numbers.push_back(
                {"+4915100" + std::to_string(1000 + i), 128, {}, true, false});
        }
        const auto saved = writer.value->save(cards);
        for (const contacts::SavedContact &contact : *saved.value) {
            ids.push_back(std::to_string(contact.contact_id));
            number_ids.push_back(contact.number_ids.front());
        }
    }

    ContactVcard() { clear(); }
    ~ContactVcard() override
    {
        vconf_set_bool(oneFileKey, 1);
        clear();
    }

    void clear() const
    {
        for (const std::string &name : files())
            std::filesystem::remove(directory + name);
        g_free(ad->vcf_path);
        ad->vcf_path = nullptr;
        ad->number_id_count = 0;
    }

    static std::vector<std::string> firstIds(size_t count)
    {
        return {ids.begin(), ids.begin() + static_cast<std::ptrdiff_t>(count)};
    }

    // As the frame does it: the record gets its clone, then the dispatcher runs.
    void launch(app_control_h request, const char *operation, const char *mime = contactMime)
    {
        app_control_set_operation(request, operation);
        app_control_set_mime(request, mime);
        if (ad->app_control)
            app_control_destroy(ad->app_control);
        ad->app_control = nullptr;
        app_control_clone(&ad->app_control, request);
        const Launch launched = {request, app.get(), CText(strdup(operation)), CText(strdup(mime)),
                                 false};
        EXPECT_EQ(dispatch(launched, ad), Next::wait);
    }
    void shareMany(size_t count)
    {
        LaunchRequest request;
        request.array(APP_CONTROL_DATA_ID, firstIds(count));
        launch(request, APP_CONTROL_OPERATION_MULTI_SHARE);
    }

    bool ended(const std::string &last)
    {
        return waitUntil([&] { return log.has(last); });
    }
    bool popupOpens()
    {
        return waitUntil([this] { return ad->popup != nullptr; });
    }
    bool fails() { return ended("_createVcf failed!"); }

    static std::set<std::string> files()
    {
        std::set<std::string> names;
        for (const auto &entry : std::filesystem::directory_iterator(directory))
            names.insert(entry.path().filename());
        return names;
    }
    static std::string text(const std::string &name)
    {
        std::ifstream in(directory + name);
        return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    }
    std::string shared() const
    {
        const Eina_List *list = ad->upload_item ? ad->upload_item->files : nullptr;
        return list ? static_cast<const char *>(eina_list_data_get(list)) : "";
    }

    static inline std::vector<std::string> ids;
    static inline std::vector<int> number_ids;
};

TEST_F(ContactVcard, OneContactBecomesAFileThatIsShared)
{
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_ID, ids[2])
        .array(APP_CONTROL_DATA_TO, {std::to_string(number_ids[0]) + "|Person 1"});
    launch(request, APP_CONTROL_OPERATION_SHARE);
    ASSERT_TRUE(popupOpens());
    EXPECT_EQ(ad->vcf_path, directory + "Person 3.vcf");
    EXPECT_EQ(shared(), ad->vcf_path);
    EXPECT_EQ(ad->upload_item->files_count, 1);
    EXPECT_EQ(ad->operation_type, OPERATION_SHARE);
    EXPECT_EQ(ad->number_id_list[0], number_ids[0]);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    const std::vector<std::string> messages = log.messages();
    const auto first =
        std::find(messages.begin(), messages.end(), "MIME case - create uri with vcf !!");
    const std::vector<std::string> expected = {
        "SINGLE SHARE - Contact",
        "thd->share_mode = 0",
        "thd->id_count = 1",
        "request_cnt = 1",
        "file name: Person 3.vcf, progress count: 1",
        "contacts_service_helper_create_vcard_files is success(0)",
    };
    EXPECT_THAT(messages, ::testing::IsSupersetOf(expected));
    EXPECT_NE(first, messages.end());
}

TEST_F(ContactVcard, ManyContactsShareOneFileByDefault)
{
    shareMany(99);
    EXPECT_EQ(ad->processing_popup, nullptr);
    ASSERT_TRUE(popupOpens());
    EXPECT_EQ(shared(), directory + "contacts.vcf");
    EXPECT_EQ(files(), std::set<std::string>{"contacts.vcf"});
    EXPECT_THAT(text("contacts.vcf"),
                AllOf(HasSubstr("FN:Person 1\r\n"), HasSubstr("FN:Person 99\r\n")));
    EXPECT_TRUE(log.has("MULTI SHARE - Contact"));
    EXPECT_EQ(ad->operation_type, OPERATION_SHARE) << "a file is shared, however many contacts";
    EXPECT_FALSE(log.has("Contact file count is 100 or more. Showing Preparing... popup"));
}

TEST_F(ContactVcard, AHundredContactsShowThatSomethingGoesOn)
{
    shareMany(100);
    ASSERT_NE(ad->processing_popup, nullptr);
    EXPECT_NE(evas_object_data_get(ad->processing_popup, "progressbar"), nullptr);
    Evas_Object *layout = elm_object_content_get(ad->processing_popup);
    EXPECT_STREQ(elm_object_part_text_get(layout, "elm.text"), "Processing…");
    const std::vector<std::string> messages = log.messages();
    EXPECT_EQ(std::count(messages.begin(), messages.end(),
                         "Contact file count is 100 or more. Showing Preparing... popup"),
              1);
    ASSERT_TRUE(popupOpens());
    EXPECT_EQ(ad->processing_popup, nullptr);
}

TEST_F(ContactVcard, OfSeparateFilesTenAreWrittenAndTheLastIsShared)
{
    vconf_set_bool(oneFileKey, 0);
    shareMany(150);
    EXPECT_NE(ad->processing_popup, nullptr);
    ASSERT_TRUE(popupOpens());
    EXPECT_TRUE(log.has("thd->share_mode = 1"));
    EXPECT_TRUE(log.has("thd->id_count = 150"));
    EXPECT_TRUE(log.has("request_cnt = 10"));
    EXPECT_TRUE(log.has("file name: Person 10.vcf, progress count: 10"));
    EXPECT_EQ(files().size(), 10U);
    EXPECT_EQ(shared(), directory + "Person 10.vcf");
}

TEST_F(ContactVcard, TheOwnProfileIsSharedWhateverTheId)
{
    contacts::ContactCard me;
    me.display_name = "Me";
    me.name_source = contacts::NameSource::Name;
    ASSERT_TRUE(contacts::saveMyProfile(me));
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_TYPE, "my_profile").text(APP_CONTROL_DATA_ID, "99999");
    launch(request, APP_CONTROL_OPERATION_SHARE);
    ASSERT_TRUE(popupOpens());
    EXPECT_EQ(shared(), directory + "Me.vcf");

    clear();
    log.restart();
    LaunchRequest many;
    many.text(APP_CONTROL_DATA_TYPE, "my_profile").array(APP_CONTROL_DATA_ID, firstIds(1));
    launch(many, APP_CONTROL_OPERATION_MULTI_SHARE);
    ASSERT_TRUE(ended("contacts_service_helper_create_vcard_files is success(0)"));
    ASSERT_TRUE(waitUntil([this] { return shared() == directory + "Person 1.vcf"; }));
    std::filesystem::remove(std::string(getenv("XDG_DATA_HOME")) +
                            "/pelliko-platform/my-profile.vcf");
}

TEST_F(ContactVcard, AProfileThatIsNotThereFailsAndNeedsNoId)
{
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_TYPE, "my_profile");
    launch(request, APP_CONTROL_OPERATION_SHARE);
    ASSERT_TRUE(fails());
    EXPECT_TRUE(log.has("contacts_service_helper_create_vcard_files is failed(-61)"));
}

TEST_F(ContactVcard, AFailureNeitherExitsNorLeavesAClearWindow)
{
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_ID, "99999");
    launch(request, APP_CONTROL_OPERATION_SHARE);
    ASSERT_TRUE(fails());
    EXPECT_EQ(ad->vcf_path, nullptr);
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_FALSE(evas_object_visible_get(ad->win));
    EXPECT_FALSE(log.has(exits));
    EXPECT_EQ(files(), std::set<std::string>{});
}

TEST_F(ContactVcard, AFailureAfterProcessingClosesThePopup)
{
    LaunchRequest request;
    request.array(APP_CONTROL_DATA_ID, std::vector<std::string>(100, "99999"));
    launch(request, APP_CONTROL_OPERATION_MULTI_SHARE);
    EXPECT_NE(ad->processing_popup, nullptr);
    ASSERT_TRUE(fails());
    EXPECT_EQ(ad->processing_popup, nullptr);
    EXPECT_FALSE(evas_object_visible_get(ad->win));
}

TEST_F(ContactVcard, AFailureKeepsTheFileOfAnEarlierShare)
{
    shareMany(1);
    ASSERT_TRUE(popupOpens());
    log.restart();
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_ID, "99999");
    launch(request, APP_CONTROL_OPERATION_SHARE);
    ASSERT_TRUE(ended("contacts_service_helper_create_vcard_files is failed(-61)"));
    EXPECT_EQ(ad->vcf_path, directory + "Person 1.vcf");
}

TEST_F(ContactVcard, OtherOperationsNameNoContact)
{
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_ID, ids[0]);
    launch(request, APP_CONTROL_OPERATION_DEFAULT);
    EXPECT_EQ(ad->operation_type, OPERATION_SHARE);
    ASSERT_TRUE(fails());
    EXPECT_TRUE(log.has("thd->id_count = 0"));
    EXPECT_FALSE(log.has("Default operation, check upload/download resume"));
}

TEST_F(ContactVcard, ANewerRequestDoesNotTakePart)
{
    LaunchRequest request;
    request.text(APP_CONTROL_DATA_ID, ids[0])
        .array(APP_CONTROL_DATA_TO, {std::to_string(number_ids[1])});
    launch(request, APP_CONTROL_OPERATION_SHARE);
    const LaunchRequest newer;
    app_control_destroy(ad->app_control);
    app_control_clone(&ad->app_control, newer);
    ad->operation_type = OPERATION_SEND_SMS;
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ASSERT_TRUE(popupOpens());
    EXPECT_EQ(ad->number_id_list[0], number_ids[1]);
    EXPECT_EQ(ad->operation_type, OPERATION_SHARE);
    EXPECT_EQ(ad->action_type, ACTION_UPLOAD);
}

TEST_F(ContactVcard, RequestsAreDoneOneAfterTheOther)
{
    for (size_t i = 0; i < 3; ++i) {
        LaunchRequest request;
        request.text(APP_CONTROL_DATA_ID, ids[i]);
        launch(request, APP_CONTROL_OPERATION_SHARE);
    }
    ASSERT_TRUE(waitUntil([this] { return shared() == directory + "Person 3.vcf"; }));
    std::vector<std::string> written;
    for (const std::string &message : log.messages()) {
        if (message.starts_with("file name: "))
            written.push_back(message);
    }
    EXPECT_THAT(written, ::testing::ElementsAre("file name: Person 1.vcf, progress count: 1",
                                                "file name: Person 2.vcf, progress count: 1",
                                                "file name: Person 3.vcf, progress count: 1"));
}

// Holds the toolkit's only worker, so that a job behind it has not begun.
class HeldWorker
{
public:
    HeldWorker() : m_before(ecore_thread_max_get())
    {
        ecore_thread_max_set(1);
        m_gate.lock();
        ecore_thread_run(
            [](void *data, Ecore_Thread *) {
                auto *gate = static_cast<std::mutex *>(data);
                gate->lock();
                gate->unlock();
            },
            nullptr, nullptr, &m_gate);
    }
    void release()
    {
        m_gate.unlock();
        ecore_thread_max_set(m_before);
    }

private:
    int m_before;
    std::mutex m_gate;
};

TEST_F(ContactVcard, TheBackKeyDropsTheShareAndLeaves)
{
    HeldWorker worker;
    shareMany(150);
    ASSERT_NE(ad->processing_popup, nullptr);
    ASSERT_TRUE(settle(elm_object_content_get(ad->processing_popup)));
    pressKey("Escape");
    EXPECT_TRUE(waitUntil([this] { return ad->processing_popup == nullptr; }));
    EXPECT_FALSE(evas_object_visible_get(ad->win));
    worker.release();
    ASSERT_TRUE(ended(exits));
    EXPECT_TRUE(log.has("contacts_service_helper_create_vcard_files is success(0)"));
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_FALSE(log.has("Operation Share/Multiple Share"));
}

TEST_F(ContactVcard, ARequestAfterTheBackKeyIsShared)
{
    HeldWorker worker;
    shareMany(100);
    ASSERT_TRUE(settle(elm_object_content_get(ad->processing_popup)));
    pressKey("Escape");
    EXPECT_TRUE(waitUntil([this] { return ad->processing_popup == nullptr; }));
    shareMany(2);
    worker.release();
    ASSERT_TRUE(popupOpens());
    EXPECT_FALSE(log.has(exits));
    EXPECT_EQ(shared(), directory + "contacts (2).vcf");
}

TEST_F(ContactVcard, TheFileNameCallbackTakesTheFirstOrEveryNameByTheMode)
{
    VcardJob job;
    job.ad = ad;
    EXPECT_TRUE(_makeVcardContactCb("a.vcf", 1, &job));
    EXPECT_TRUE(_makeVcardContactCb("b.vcf", 2, &job));
    EXPECT_EQ(ad->vcf_path, directory + "a.vcf");
    job.share_mode = 1;
    EXPECT_TRUE(_makeVcardContactCb("c.vcf", 2, &job));
    EXPECT_EQ(ad->vcf_path, directory + "c.vcf");
    EXPECT_TRUE(_makeVcardContactCb(nullptr, 3, &job));
    EXPECT_TRUE(_makeVcardContactCb("d.vcf", 3, nullptr));
    EXPECT_EQ(ad->vcf_path, directory + "c.vcf");
    EXPECT_THAT(log.messages(), Contains(HasSubstr("file_name is NULL")));
    EXPECT_THAT(log.messages(), Contains(HasSubstr("data is NULL")));
    EXPECT_TRUE(_makeVcardContactCb(std::string(2000, 'x').c_str(), 1, &job));
    EXPECT_EQ(strlen(ad->vcf_path), 1024U);
}

} // namespace
} // namespace pelliko

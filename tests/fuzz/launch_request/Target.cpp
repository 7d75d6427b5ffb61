// Launch requests as the bus brings them, and what the application reads of them. An input is read
// twice: as the bytes of a dictionary, which need not be well-formed, and as lines of words between
// tabs:
//
//   operation|uri|mime|app  VALUE
//   text                    KEY  VALUE
//   array                   KEY  VALUE  VALUE…
#include "Promise.h"
#include "Scratch.h"

#include "PellikoApp/Decimal.h"
#include "PellikoApp/ShareRequest.h"
#include "PellikoApp/SmsSender.h"
#include "PellikoApp/TextArray.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <Ecore.h>
#include <Handle.h>
#include <Serialisation.h>
#include <fstream>
#include <glib.h>

using namespace pelliko;
using pelliko::fuzz::promise;
using pelliko::platform::RequestPtr;

namespace
{

using Texts = std::vector<std::string>;

Texts wordsOf(std::string_view line)
{
    Texts words;
    while (!line.empty())
        words.emplace_back(std::string(pelliko::fuzz::takeLine(line, '\t')).c_str());
    return words;
}

void takeArray(app_control_h request, const Texts &words)
{
    std::vector<const char *> values;
    for (size_t i = 2; i < words.size(); ++i)
        values.push_back(words[i].c_str());
    app_control_add_extra_data_array(request, words[1].c_str(), values.data(),
                                     static_cast<int>(values.size()));
}

void takeLine(app_control_h request, const Texts &words)
{
    if (words.size() < 2)
        return;
    if (words[0] == "operation")
        app_control_set_operation(request, words[1].c_str());
    else if (words[0] == "uri")
        app_control_set_uri(request, words[1].c_str());
    else if (words[0] == "mime")
        app_control_set_mime(request, words[1].c_str());
    else if (words[0] == "app")
        app_control_set_app_id(request, words[1].c_str());
    else if (words[0] == "text" && words.size() > 2)
        app_control_add_extra_data(request, words[1].c_str(), words[2].c_str());
    else if (words[0] == "array")
        takeArray(request, words);
}

RequestPtr requestOf(std::string_view text)
{
    app_control_h request = nullptr;
    app_control_create(&request);
    while (!text.empty())
        takeLine(request, wordsOf(pelliko::fuzz::takeLine(text)));
    return RequestPtr(request);
}

bool same(const app_control_s &one, const app_control_s &other)
{
    return one.operation == other.operation && one.uri == other.uri && one.mime == other.mime &&
           one.appId == other.appId && one.extras == other.extras;
}

// As on the bus: the bytes of the dictionary.
RequestPtr sent(const RequestPtr &request)
{
    g_autoptr(GVariant) contents = g_variant_ref_sink(platform::toVariant(request.get()));
    g_autoptr(GBytes) bytes = g_variant_get_data_as_bytes(contents);
    g_autoptr(GVariant) received =
        g_variant_ref_sink(g_variant_new_from_bytes(G_VARIANT_TYPE_VARDICT, bytes, FALSE));
    return RequestPtr(platform::fromVariant(received));
}

void tryWire(const RequestPtr &request)
{
    const RequestPtr received = sent(request);
    promise(received && same(*request, *received), "a request arrives as it was sent");
    const std::string json = platform::toJson(request.get());
    promise(g_utf8_validate_len(json.data(), json.size(), nullptr), "a log line is text");
}

RequestPtr requestOfBytes(const uint8_t *data, size_t size)
{
    g_autoptr(GBytes) bytes = g_bytes_new(data, size);
    g_autoptr(GVariant) contents =
        g_variant_ref_sink(g_variant_new_from_bytes(G_VARIANT_TYPE_VARDICT, bytes, FALSE));
    return RequestPtr(platform::fromVariant(contents));
}

void promiseFiles(const UploadItem &item)
{
    promise(item.files_count == static_cast<int32_t>(eina_list_count(item.files)),
            "the count of files is that of the list");
    promise(static_cast<uint32_t>(item.files_size) == static_cast<uint32_t>(item.before_files_size),
            "both sums are of the same files");
}

void tryFiles(app_control_h request)
{
    PellikoAppData record;
    if (_parseMultipleDataPath(request, &record) == 0) {
        const TextArray paths(request, APP_CONTROL_DATA_PATH);
        promiseFiles(*record.upload_item);
        promise(record.upload_item->files_count + unsupported_file_count <=
                    std::max(paths.length(), 0),
                "no path is counted twice");
    }
    char *uri = nullptr;
    app_control_get_uri(request, &uri);
    if (_parseSingleDataPath(uri, &record, request) == 0) {
        promiseFiles(*record.upload_item);
        promise(record.upload_item->files_count == 1, "an address is one file");
    }
    free(uri);
    freeUploadData(record.upload_item);
    record.upload_item = nullptr;
}

void promiseIds(const TextArray &texts, int32_t count, const int32_t *ids, int32_t most)
{
    promise(count == (texts.filled() ? texts.length() : 0), "the count is that of the request");
    for (int32_t i = 0; i < most; ++i)
        promise(ids[i] == (i < count ? decimalValue(texts[i]) : 0),
                "an id is the one at its place");
}

void tryIds(app_control_h request)
{
    PellikoAppData record;
    _parseDataTo(&record, request);
    promiseIds(TextArray(request, APP_CONTROL_DATA_TO), record.number_id_count,
               record.number_id_list, maxNumberIds);
    _parseUploadResume(&record, request);
    promiseIds(TextArray(request, "upload_resume"), record.upload_resume_count,
               record.upload_resume_id_list, maxUploadResumeIds);
}

void tryMessages(app_control_h request)
{
    PellikoAppData record;
    _getSmsData(request, &record);
    const SmsJob job = makeSmsJob(&record);
    promise(record.to_msisdn_count == static_cast<int32_t>(job.to_msisdn_list.size()),
            "every recipient gets a message");
    for (char *text :
         {record.url, record.from_msisdn, record.expired_time, record.req_id, record.sms_key})
        g_free(text);
    void *number = nullptr;
    EINA_LIST_FREE(record.to_msisdn_list, number) g_free(number);
}

void tryTap(app_control_h request)
{
    g_noti_press_data = {};
    getUploadData(request);
    const auto count = static_cast<size_t>(std::max(pressedRecipientCount(), 0));
    promise(g_noti_press_data.recipients.size() <= count, "no recipient beyond the count");
    promise(g_noti_press_data.pictures.size() <= maxNumberIds, "no picture beyond the most");
}

void tryRequest(const RequestPtr &request)
{
    tryWire(request);
    tryFiles(request.get());
    tryIds(request.get());
    tryMessages(request.get());
    tryTap(request.get());
}

// Nothing is kept of the runs, and the files that the corpus names are there.
void prepare()
{
    static const pelliko::fuzz::Scratch scratch;
    std::filesystem::create_directory(scratch.path() / "velmora");
    std::ofstream(scratch.path() / "velmora" / "usage-log-off");
    std::filesystem::create_directories("/tmp/pelliko-fuzz");
    std::ofstream("/tmp/pelliko-fuzz/photo.jpg") << "a photo";
    std::ofstream("/tmp/pelliko-fuzz/empty.jpg");
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int *, char ***)
{
    ecore_init();
    prepare();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    tryRequest(requestOf(pelliko::fuzz::textOf(data, size)));
    if (const RequestPtr request = requestOfBytes(data, size))
        tryRequest(request);
    return 0;
}

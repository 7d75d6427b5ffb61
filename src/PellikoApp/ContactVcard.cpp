#include "PellikoApp/ContactVcard.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Operation.h"
#include "PellikoApp/ProcessingPopup.h"
#include "PellikoApp/ShareRequest.h"
#include "PellikoApp/SharedData.h"
#include "PellikoUploadManager/ExitPolicy.h"

#include <Ecore.h>
#include <Evas.h>
#include <algorithm>
#include <contacts_service_helper.h>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <glib.h>
#include <memory>
#include <new>
#include <vconf.h>

namespace pelliko
{

namespace
{

constexpr const char *oneFileKey = "db/contacts-svc/share_multiple_contacts_as_one_file";
constexpr const char *myProfileType = "my_profile";
constexpr int maxFiles = 10; // of one share
constexpr size_t pathSize = 1025;

// One request that waits for its file. The request is a clone of the moment: the record's may be a
// newer one by the time the file is there.
struct Export {
    Export(PellikoAppData *record, app_control_h request) : ad(record)
    {
        app_control_clone(&app_control, request);
    }
    ~Export()
    {
        if (app_control)
            app_control_destroy(app_control);
    }
    Export(const Export &) = delete;
    Export &operator=(const Export &) = delete;

    PellikoAppData *ad;
    app_control_h app_control = nullptr;
    bool is_dropped = false; // by the user
};

// In the order of the requests; a worker is at the first.
std::deque<std::unique_ptr<Export>> &_exports()
{
    static std::deque<std::unique_ptr<Export>> exports;
    return exports;
}

struct JobRelease {
    void operator()(VcardJob *job) const
    {
        for (int i = 0; job->id_list && i < job->id_count; ++i)
            free(job->id_list[i]);
        free(job->id_list);
        delete job;
    }
};
using OwnedJob = std::unique_ptr<VcardJob, JobRelease>;

void _takeSingleId(VcardJob &job)
{
    char *id = nullptr;
    app_control_get_extra_data(job.app_control, APP_CONTROL_DATA_ID, &id);
    CText owned(id);
    if (!owned)
        return;
    job.id_list = static_cast<char **>(calloc(1, sizeof(char *)));
    if (!job.id_list)
        return;
    job.id_list[0] = owned.release();
    job.id_count = 1;
}

void _readSingleShare(VcardJob &job)
{
    LOG_DEBUG("SINGLE SHARE - Contact");
    char *type = nullptr;
    app_control_get_extra_data(job.app_control, APP_CONTROL_DATA_TYPE, &type);
    const CText owned(type);
    if (owned && strcmp(owned.get(), myProfileType) == 0)
        job.is_my_profile = 1;
    _takeSingleId(job);
}

void _readMultiShare(VcardJob &job)
{
    LOG_DEBUG("MULTI SHARE - Contact");
    int one_file = 1;
    if (vconf_get_bool(oneFileKey, &one_file) != 0)
        one_file = 1;
    job.share_mode = one_file == 1 ? 0 : 1;
    if (app_control_get_extra_data_array(job.app_control, APP_CONTROL_DATA_ID, &job.id_list,
                                         &job.id_count) != APP_CONTROL_ERROR_NONE) {
        job.id_list = nullptr;
        job.id_count = 0;
    }
}

void _readRequest(VcardJob &job, const char *operation)
{
    if (!operation)
        return;
    if (strcmp(operation, APP_CONTROL_OPERATION_SHARE) == 0)
        _readSingleShare(job);
    else if (strcmp(operation, APP_CONTROL_OPERATION_MULTI_SHARE) == 0)
        _readMultiShare(job);
}

int _writeFiles(VcardJob &job, int request_cnt)
{
    if (!job.is_my_profile)
        return contacts_service_helper_create_vcard_files(sharedDataDirectory, job.id_list,
                                                          request_cnt, job.share_mode,
                                                          _makeVcardContactCb, &job);
    const char *id = job.id_list ? job.id_list[0] : nullptr;
    return contacts_service_helper_create_vcard_file_by_my_profile(sharedDataDirectory, id,
                                                                   _makeVcardContactCb, &job);
}

void _work(void *data, Ecore_Thread *)
{
    const auto *work = static_cast<Export *>(data);
    _createVcf(work->app_control, work->ad);
}

void _end(void *, Ecore_Thread *)
{
    _createVcfThreadEnd();
}

// The clear window lies above everything and would swallow every touch.
void _leaveScreen(PellikoAppData *ad)
{
    if (!ad->popup && !ad->processing_popup)
        _hideWindow(ad);
}

void _runFirst()
{
    Export &first = *_exports().front();
    if (ecore_thread_run(_work, _end, nullptr, &first))
        return;
    LOG_ERROR("ecore_thread_run failed");
    _leaveScreen(first.ad);
    _exports().pop_front();
}

void _share(const Export &done)
{
    PellikoAppData *ad = done.ad;
    const std::unique_ptr<char, decltype(&g_free)> path(g_strdup(ad->vcf_path), g_free);
    if (_parseSingleDataPath(path.get(), ad, done.app_control) == -1) {
        LOG_DEBUG("_parseSingleDataPath failed!");
        _leaveScreen(ad);
        return;
    }
    _parseDataTo(ad, done.app_control);
    ad->action_type = ACTION_UPLOAD;
    // Another request may have come while the file was written.
    ad->operation_type = OPERATION_SHARE;
    doOperation(ad);
}

// The user does not want to wait. A file that is being written cannot be left half, so the worker
// goes on to its end, and nothing follows it.
void _processingBackCb(void *data, Evas_Object *, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    LOG_DEBUG("processing is left, the contacts are not shared");
    for (const auto &waiting : _exports())
        waiting->is_dropped = true;
    evas_object_del(ad->processing_popup);
    _leaveScreen(ad);
}

} // namespace

void startContactVcard(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    _exports().push_back(std::make_unique<Export>(ad, ad->app_control));
    if (_exports().size() == 1)
        _runFirst();
}

int _createVcf(app_control_h request, PellikoAppData *ad)
{
    const OwnedJob thd(new (std::nothrow) VcardJob);
    RETURN_VALUE_IF_NULL(thd, -1, "thd is NULL");
    thd->ad = ad;
    thd->app_control = request;
    char *text = nullptr;
    app_control_get_operation(request, &text);
    const CText operation(text);
    _readRequest(*thd, operation.get());
    const int request_cnt =
        thd->share_mode == 1 ? std::min(thd->id_count, maxFiles) : thd->id_count;
    LOG_DEBUG("thd->share_mode = %d", thd->share_mode);
    LOG_DEBUG("thd->id_count = %d", thd->id_count);
    LOG_DEBUG("request_cnt = %d", request_cnt);
    const int error = _writeFiles(*thd, request_cnt);
    if (error != 0)
        LOG_DEBUG("contacts_service_helper_create_vcard_files is failed(%d)", error);
    else
        LOG_DEBUG("contacts_service_helper_create_vcard_files is success(%d)", error);
    return 0;
}

bool _makeVcardContactCb(const char *file_name, int progress_count, void *job)
{
    RETURN_VALUE_IF_NULL(file_name, true, "file_name is NULL");
    RETURN_VALUE_IF_NULL(job, true, "data is NULL");
    const auto *thd = static_cast<VcardJob *>(job);
    LOG_DEBUG("file name: %s, progress count: %d", file_name, progress_count);
    if (progress_count != 1 && thd->share_mode == 0)
        return true;
    char path[pathSize];
    snprintf(path, sizeof(path), "%s%s", sharedDataDirectory, file_name);
    g_free(thd->ad->vcf_path);
    thd->ad->vcf_path = g_strdup(path);
    return true;
}

void _createVcfThreadEnd()
{
    RETURN_IF(_exports().empty(), "no export has ended");
    const std::unique_ptr<Export> done = std::move(_exports().front());
    PellikoAppData *ad = getAppData();
    if (ad->processing_popup)
        evas_object_del(ad->processing_popup);
    if (done->is_dropped) {
        if (_exports().size() == 1)
            safeExit();
    } else if (!ad->vcf_path) {
        LOG_DEBUG("_createVcf failed!");
        _leaveScreen(ad);
    } else {
        _share(*done);
    }
    // Only now, for the next worker writes the path that was just read.
    _exports().pop_front();
    if (!_exports().empty())
        _runFirst();
}

void _showProcessingPopup(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    LOG_DEBUG("Contact file count is 100 or more. Showing Preparing... popup");
    if (ad->win && !ad->processing_popup)
        openProcessingPopup(ad, _processingBackCb);
}

} // namespace pelliko

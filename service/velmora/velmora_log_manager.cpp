#include "velmora_log_manager.h"

#include "RecordLine.h"
#include "RecordLog.h"

#include <cstdint>
#include <ctime>
#include <map>
#include <memory>
#include <mutex>
#include <new>
#include <optional>

#include <glib.h>

using namespace pelliko::velmora;

struct velmora_log_manager_s {
    explicit velmora_log_manager_s(RecordLogPlace place) : log(std::move(place)) {}
    const RecordLog log;
};

namespace
{
using Handle = std::shared_ptr<velmora_log_manager_s>;

// All handles that live, and the number of the last record. Never destroyed: a detached thread may
// insert until the very end of the process.
struct Handles {
    std::mutex mutex;
    std::map<velmora_log_manager_h, Handle> alive;
    uint32_t lastRequest = 0;
};

Handles &handles()
{
    static auto *const all = new Handles;
    return *all;
}

Handle find(velmora_log_manager_h handle)
{
    Handles &all = handles();
    const std::lock_guard guard(all.mutex);
    const auto found = all.alive.find(handle);
    return found == all.alive.end() ? nullptr : found->second;
}

int nextRequest()
{
    constexpr uint32_t mostPositive = INT32_MAX;
    Handles &all = handles();
    const std::lock_guard guard(all.mutex);
    all.lastRequest = all.lastRequest % mostPositive + 1;
    return static_cast<int>(all.lastRequest);
}

// What the loop has to tell about a record, unless its handle is gone by then.
struct Completion {
    std::weak_ptr<velmora_log_manager_s> handle;
    int request;
    std::string uri;
    int error;
    velmora_log_manager_insert_cb callback;
    void *userData;
};

gboolean complete(gpointer data)
{
    const auto *done = static_cast<Completion *>(data);
    if (!done->handle.expired()) {
        done->callback(done->request, done->uri.c_str(), done->error, done->userData);
    }
    return G_SOURCE_REMOVE;
}

// Always by way of the loop, whose thread may be another one.
void announce(std::unique_ptr<Completion> done)
{
    if (done->callback) {
        g_idle_add_full(G_PRIORITY_DEFAULT, complete, done.release(),
                        [](gpointer data) { delete static_cast<Completion *>(data); });
    }
}

// No exception may reach a C caller; what can be thrown is a lack of memory.
template <typename Call> int guarded(const Call &call)
{
    try {
        return call();
    } catch (const std::bad_alloc &) {
        return TIZEN_ERROR_OUT_OF_MEMORY;
    }
}

int create(velmora_log_manager_h &out)
{
    const auto made = std::make_shared<velmora_log_manager_s>(RecordLogPlace::ofUser());
    const int error = made->log.prepare();
    if (error != 0) {
        return error;
    }
    Handles &all = handles();
    const std::lock_guard guard(all.mutex);
    all.alive.emplace(made.get(), made);
    out = made.get();
    return TIZEN_ERROR_NONE;
}

int destroy(velmora_log_manager_h handle)
{
    Handles &all = handles();
    const std::lock_guard guard(all.mutex);
    return all.alive.erase(handle) == 1 ? TIZEN_ERROR_NONE : TIZEN_ERROR_INVALID_PARAMETER;
}
} // namespace

int velmora_log_manager_create(velmora_log_manager_h *handle)
{
    return handle ? guarded([&] { return create(*handle); }) : TIZEN_ERROR_INVALID_PARAMETER;
}

int velmora_log_manager_destroy(velmora_log_manager_h handle)
{
    return guarded([&] { return destroy(handle); });
}

int velmora_log_manager_insert(velmora_log_manager_h handle, const char *uri, bundle *data,
                               velmora_log_manager_insert_cb callback, void *user_data,
                               int *request_id)
{
    if (!uri || !data || !request_id) {
        return TIZEN_ERROR_INVALID_PARAMETER;
    }
    return guarded([&]() -> int {
        const Handle found = find(handle);
        const auto line = recordLine(uri, data, std::time(nullptr));
        if (!found || !line) {
            return TIZEN_ERROR_INVALID_PARAMETER;
        }
        const int request = nextRequest();
        auto done =
            std::make_unique<Completion>(Completion{found, request, uri, 0, callback, user_data});
        done->error = found->log.append(*line);
        *request_id = request;
        announce(std::move(done));
        return TIZEN_ERROR_NONE;
    });
}

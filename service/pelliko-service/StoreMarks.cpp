#include "StoreMarks.h"

#include <ContactsWriter.h>
#include <PhoneNumbers.h>
#include <StateDir.h>

#include <sys/stat.h>
#include <utility>

namespace pelliko::service
{
namespace
{
using contacts::ContactsWriter;
using Work = std::function<std::function<void()>()>;

constexpr const char *storeName = "contacts.db";

// An empty log is as good as none: readers make it and take it away.
StoreMarks::Print printOfStore()
{
    const std::string store = platform::stateDirectory() + "/" + storeName;
    StoreMarks::Print print{};
    size_t place = 0;
    for (const std::string &file : {store, store + "-wal"}) {
        struct stat status {
        };
        if (stat(file.c_str(), &status) == 0 && status.st_size > 0) {
            print[place] = status.st_size;
            print[place + 1] = status.st_mtim.tv_sec * 1'000'000'000LL + status.st_mtim.tv_nsec;
        }
        place += 2;
    }
    return print;
}

bool storeIsThere()
{
    struct stat status {
    };
    return stat((platform::stateDirectory() + "/" + storeName).c_str(), &status) == 0;
}

struct Numbers {
    bool read = false;
    std::vector<ContactNumber> numbers;
};

Numbers readNumbers(const std::string &ownNumber)
{
    if (!storeIsThere()) {
        return {true, {}};
    }
    auto writer = ContactsWriter::open();
    auto listed = writer ? writer.value->numbers() : decltype(writer.value->numbers()){};
    if (!listed) {
        g_warning("the contacts cannot be read: %s",
                  (writer ? listed.error : writer.error).c_str());
        return {};
    }
    Numbers result{true, {}};
    for (const contacts::ListedNumber &one : *listed.value) {
        numbers::NumberForm form = numbers::formOf(one.number, {}, ownNumber);
        if (form.fault.empty()) {
            result.numbers.push_back({one.number_id, std::move(form.e164), one.joined});
        }
    }
    return result;
}

bool writeMarks(const std::vector<MarkChange> &changes)
{
    auto writer = ContactsWriter::open();
    if (!writer) {
        g_warning("the contacts cannot be marked: %s", writer.error.c_str());
        return false;
    }
    for (const MarkChange &change : changes) {
        const auto letters = change.joined ? std::optional<std::string>("R") : std::nullopt;
        // A number that has gone meanwhile needs no mark.
        if (const auto set = writer.value->setServiceLetters(change.numberId, letters); !set) {
            g_warning("the contacts cannot be marked: %s", set.error.c_str());
            return false;
        }
    }
    return true;
}

void deleteWork(gpointer work)
{
    std::unique_ptr<Work>(static_cast<Work *>(work));
}

void deleteThen(gpointer then)
{
    std::unique_ptr<std::function<void()>>(static_cast<std::function<void()> *>(then));
}

void runWork(GTask *task, gpointer, gpointer work, GCancellable *)
{
    g_task_return_pointer(task, new std::function<void()>((*static_cast<Work *>(work))()),
                          deleteThen);
}

void onWorked(GObject *, GAsyncResult *result, gpointer)
{
    const std::unique_ptr<std::function<void()>> then(
        static_cast<std::function<void()> *>(g_task_propagate_pointer(G_TASK(result), nullptr)));
    (*then)();
}
} // namespace

StoreMarks::StoreMarks(std::function<void()> changed)
    : changed_(std::move(changed)), self_(std::make_shared<StoreMarks *>(this))
{
    g_autoptr(GFile) folder = g_file_new_for_path(platform::stateDirectory().c_str());
    g_autoptr(GError) error = nullptr;
    monitor_ = g_file_monitor_directory(folder, G_FILE_MONITOR_NONE, nullptr, &error);
    if (!monitor_) {
        g_warning("changes of the contacts are not noticed: %s", error->message);
        return;
    }
    g_signal_connect(monitor_, "changed", G_CALLBACK(onChange), this);
}

StoreMarks::~StoreMarks()
{
    if (monitor_) {
        g_signal_handlers_disconnect_by_data(monitor_, this);
        g_object_unref(monitor_);
    }
}

void StoreMarks::onChange(GFileMonitor *, GFile *file, GFile *, GFileMonitorEvent, gpointer data)
{
    auto &self = *static_cast<StoreMarks *>(data);
    g_autofree char *name = g_file_get_basename(file);
    if (g_str_has_prefix(name, storeName) && printOfStore() != self.seen_) {
        self.changed_();
    }
}

// What the work returns runs on the main loop, unless this has ended.
void StoreMarks::onThread(Work work)
{
    GTask *task = g_task_new(nullptr, nullptr, onWorked, nullptr);
    g_task_set_task_data(task, new Work(std::move(work)), deleteWork);
    g_task_run_in_thread(task, runWork);
    g_object_unref(task);
}

void StoreMarks::read(const std::string &ownNumber,
                      std::function<void(bool, const std::vector<ContactNumber> &)> done)
{
    onThread([ownNumber, weak = std::weak_ptr<StoreMarks *>(self_), done = std::move(done)] {
        const Print before = printOfStore();
        const auto found = std::make_shared<Numbers>(readNumbers(ownNumber));
        // Closing the store may tidy its files up; what others wrote meanwhile is seen as a change.
        const Print after = printOfStore();
        const Print seen = after[0] == before[0] ? after : before;
        return std::function<void()>([weak, done, found, seen] {
            if (const auto self = weak.lock()) {
                (*self)->seen_ = seen;
                done(found->read, found->numbers);
            }
        });
    });
}

void StoreMarks::write(const std::vector<MarkChange> &changes, std::function<void(bool)> done)
{
    onThread([changes, weak = std::weak_ptr<StoreMarks *>(self_), done = std::move(done)] {
        const bool written = writeMarks(changes);
        return std::function<void()>([weak, done, written] {
            if (weak.lock()) {
                done(written);
            }
        });
    });
}

} // namespace pelliko::service

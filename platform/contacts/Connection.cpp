#include "Connection.h"

#include <memory>
#include <mutex>

#include <SQLiteCpp/Database.h>

#include "Database.h"
#include "contacts.h"

namespace pelliko::contacts
{
namespace
{

std::mutex g_process_mutex;
int g_process_count = 0;
thread_local int t_thread_count = 0;
thread_local std::unique_ptr<SQLite::Database> t_database;

bool processIsConnected()
{
    const std::lock_guard lock(g_process_mutex);
    return g_process_count > 0;
}

int openForThread() noexcept
{
    try {
        if (!t_database)
            t_database = openDatabase(Access::Read);
        return CONTACTS_ERROR_NONE;
    } catch (...) {
        return errorOfException();
    }
}

// Other threads that used the process's connection close theirs when they end.
void closeIfUnused()
{
    if (t_thread_count == 0 && !processIsConnected())
        t_database.reset();
}

} // namespace

SQLite::Database *threadDatabase()
{
    if (t_thread_count == 0 && !processIsConnected())
        return nullptr;
    if (!t_database)
        t_database = openDatabase(Access::Read);
    return t_database.get();
}

} // namespace pelliko::contacts

using namespace pelliko::contacts;

extern "C" int contacts_connect(void)
{
    const int result = openForThread();
    if (result == CONTACTS_ERROR_NONE) {
        const std::lock_guard lock(g_process_mutex);
        ++g_process_count;
    }
    return result;
}

extern "C" int contacts_disconnect(void)
{
    {
        const std::lock_guard lock(g_process_mutex);
        if (g_process_count == 0)
            return CONTACTS_ERROR_IPC;
        --g_process_count;
    }
    closeIfUnused();
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_connect_on_thread(void)
{
    const int result = openForThread();
    if (result == CONTACTS_ERROR_NONE)
        ++t_thread_count;
    return result;
}

extern "C" int contacts_disconnect_on_thread(void)
{
    if (t_thread_count == 0)
        return CONTACTS_ERROR_IPC;
    --t_thread_count;
    closeIfUnused();
    return CONTACTS_ERROR_NONE;
}

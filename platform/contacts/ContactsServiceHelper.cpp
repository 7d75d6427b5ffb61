#include "contacts_service_helper.h"

#include <charconv>
#include <cstring>
#include <optional>
#include <system_error>
#include <vector>

#include <SQLiteCpp/SQLiteCpp.h>

#include "Connection.h"
#include "Database.h"
#include "ExportFiles.h"
#include "MyProfile.h"
#include "StoredCards.h"
#include "VcardWriting.h"
#include "contacts.h"

namespace pelliko::contacts
{
namespace
{

enum class Layout { OneFile, FilePerContact };

// The callback of an export and what it is called with.
struct Progress {
    contacts_service_helper_vcard_cb callback;
    void *user_data;
};

class ThreadConnection
{
public:
    ThreadConnection() : m_result(contacts_connect_on_thread()) {}
    ~ThreadConnection()
    {
        if (m_result == CONTACTS_ERROR_NONE)
            contacts_disconnect_on_thread();
    }
    ThreadConnection(const ThreadConnection &) = delete;
    ThreadConnection &operator=(const ThreadConnection &) = delete;

    [[nodiscard]] int result() const { return m_result; }

private:
    int m_result;
};

std::optional<int> contactId(const char *text)
{
    int id = 0;
    const char *end = text ? text + std::strlen(text) : nullptr;
    const auto read = std::from_chars(text, end, id);
    const bool whole = text && read.ec == std::errc() && read.ptr == end;
    return whole && id > 0 ? std::optional(id) : std::nullopt;
}

std::vector<int> contactIds(char **id_list, int count)
{
    std::vector<int> ids;
    for (int i = 0; i < count; ++i) {
        const std::optional<int> id = contactId(id_list[i]);
        if (!id)
            return {};
        ids.push_back(*id);
    }
    return ids;
}

// Names are given out only when all files are whole, so that nobody goes on with a part of an
// export that then fails.
void publish(ExportFiles &files, const Progress &progress)
{
    files.finish();
    for (size_t i = 0; i < files.count(); ++i) {
        const std::string name = files.publish(i);
        if (!progress.callback(name.c_str(), static_cast<int>(i) + 1, progress.user_data))
            return;
    }
}

std::string stemOf(const ContactCard &card)
{
    return fileStem(shownName(card));
}

// Reads all contacts as they were at one moment, whatever another program writes meanwhile.
int exportContacts(const char *directory, const std::vector<int> &ids, Layout layout,
                   const Progress &progress)
{
    SQLite::Database *database = threadDatabase();
    if (!database)
        return CONTACTS_ERROR_IPC;
    ExportFiles files(directory);
    {
        const SQLite::Transaction snapshot(*database);
        StoredCards cards(*database);
        for (const int id : ids) {
            const std::optional<ContactCard> card = cards.read(id);
            if (!card)
                return CONTACTS_ERROR_NO_DATA;
            if (layout == Layout::FilePerContact || ids.size() == 1)
                files.begin(stemOf(*card));
            else if (files.count() == 0)
                files.begin("contacts");
            files.write(vcardText(*card));
        }
    }
    publish(files, progress);
    return CONTACTS_ERROR_NONE;
}

int exportMyProfile(const char *directory, const Progress &progress)
{
    const std::optional<ContactCard> card = readMyProfile();
    if (!card)
        return CONTACTS_ERROR_NO_DATA;
    ExportFiles files(directory);
    files.begin(stemOf(*card));
    files.write(vcardText(*card));
    publish(files, progress);
    return CONTACTS_ERROR_NONE;
}

int errorOf(const std::error_code &code)
{
    if (code == std::errc::no_space_on_device)
        return CONTACTS_ERROR_FILE_NO_SPACE;
    if (code == std::errc::permission_denied || code == std::errc::read_only_file_system)
        return CONTACTS_ERROR_PERMISSION_DENIED;
    return CONTACTS_ERROR_SYSTEM;
}

template <typename Work> int attempt(Work &&work) noexcept
{
    try {
        return work();
    } catch (const std::system_error &error) {
        return errorOf(error.code());
    } catch (...) {
        return errorOfException();
    }
}

} // namespace
} // namespace pelliko::contacts

using namespace pelliko::contacts;

extern "C" int contacts_service_helper_create_vcard_files(const char *directory, char **id_list,
                                                          int count, int share_mode,
                                                          contacts_service_helper_vcard_cb callback,
                                                          void *user_data)
{
    const bool known_mode = share_mode == 0 || share_mode == 1;
    if (!directory || !id_list || count <= 0 || !known_mode || !callback)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return attempt([&] {
        const std::vector<int> ids = contactIds(id_list, count);
        if (ids.empty())
            return int{CONTACTS_ERROR_INVALID_PARAMETER};
        const ThreadConnection connection;
        if (connection.result() != CONTACTS_ERROR_NONE)
            return connection.result();
        const Layout layout = share_mode == 0 ? Layout::OneFile : Layout::FilePerContact;
        return exportContacts(directory, ids, layout, {callback, user_data});
    });
}

extern "C" int contacts_service_helper_create_vcard_file_by_my_profile(
    const char *directory, const char *, contacts_service_helper_vcard_cb callback, void *user_data)
{
    if (!directory || !callback)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return attempt([&] { return exportMyProfile(directory, {callback, user_data}); });
}

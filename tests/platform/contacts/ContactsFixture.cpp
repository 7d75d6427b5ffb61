#include "ContactsFixture.h"

#include <cstdlib>
#include <fstream>

#include <SQLiteCpp/Database.h>

namespace pelliko::contacts::test
{

Store::Store()
{
    std::string folder = (std::filesystem::temp_directory_path() / "contacts-XXXXXX").string();
    m_folder = mkdtemp(folder.data());
    setenv("XDG_DATA_HOME", m_folder.c_str(), 1);
}

Store::~Store()
{
    std::filesystem::remove_all(m_folder);
}

std::filesystem::path Store::databaseFile() const
{
    return m_folder / "pelliko-platform" / "contacts.db";
}

std::filesystem::path Store::pictureFolder() const
{
    return m_folder / "pelliko-platform" / "contacts-pictures";
}

std::string Store::file(const std::string &name, const std::string &bytes) const
{
    const std::string path = m_folder / name;
    std::ofstream(path, std::ios::binary) << bytes;
    return path;
}

void Store::sql(const std::string &text) const
{
    SQLite::Database(databaseFile().string(), SQLite::OPEN_READWRITE).exec(text);
}

std::vector<int> Store::add(const std::string &name, const std::vector<std::string> &numbers,
                            bool joined)
{
    ContactCard contact;
    contact.display_name = name;
    contact.name_source = NameSource::Name;
    for (const std::string &number : numbers)
        contact.numbers.push_back({number, number_cell, {}, false, joined});
    return save(contact).number_ids;
}

SavedContact Store::save(const ContactCard &contact)
{
    auto writer = ContactsWriter::open();
    EXPECT_TRUE(writer) << writer.error;
    auto saved = writer.value->save({&contact, 1});
    EXPECT_TRUE(saved) << saved.error;
    return saved.value->front();
}

std::vector<std::string> texts(contacts_list_h list, unsigned int property_id)
{
    std::vector<std::string> found;
    contacts_record_h record = nullptr;
    while (contacts_list_get_current_record_p(list, &record) == CONTACTS_ERROR_NONE) {
        char *text = nullptr;
        EXPECT_EQ(contacts_record_get_str_p(record, property_id, &text), CONTACTS_ERROR_NONE);
        found.emplace_back(text ? text : "(null)");
        contacts_list_next(list);
    }
    EXPECT_EQ(contacts_list_destroy(list, true), CONTACTS_ERROR_NONE);
    return found;
}

std::vector<int> integers(contacts_list_h list, unsigned int property_id)
{
    std::vector<int> found;
    contacts_record_h record = nullptr;
    while (contacts_list_get_current_record_p(list, &record) == CONTACTS_ERROR_NONE) {
        int number = -1;
        EXPECT_EQ(contacts_record_get_int(record, property_id, &number), CONTACTS_ERROR_NONE);
        found.push_back(number);
        contacts_list_next(list);
    }
    EXPECT_EQ(contacts_list_destroy(list, true), CONTACTS_ERROR_NONE);
    return found;
}

contacts_list_h query(const char *view_uri, contacts_filter_h filter)
{
    contacts_query_h made = nullptr;
    contacts_list_h list = nullptr;
    EXPECT_EQ(contacts_query_create(view_uri, &made), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_query_set_filter(made, filter), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_db_get_records_with_query(made, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_filter_destroy(filter), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_query_destroy(made), CONTACTS_ERROR_NONE);
    return list;
}

contacts_filter_h textFilter(const char *view_uri, unsigned int property_id,
                             contacts_match_str_flag_e match, const char *value)
{
    contacts_filter_h filter = nullptr;
    EXPECT_EQ(contacts_filter_create(view_uri, &filter), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_filter_add_str(filter, property_id, match, value), CONTACTS_ERROR_NONE);
    return filter;
}

ContactCard card(const std::string &name, const std::string &number)
{
    ContactCard made;
    made.display_name = name;
    made.name_source = NameSource::Name;
    made.numbers.push_back({number, number_cell, {}, false, false});
    return made;
}

std::string picture(char letter)
{
    return std::string("\x89PNG\r\n\x1a\n") + letter;
}

} // namespace pelliko::contacts::test

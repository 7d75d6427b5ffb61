// A store of its own for every case, and short ways to fill and read it.
#pragma once

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "ContactsWriter.h"
#include "contacts_ex.h"

namespace pelliko::contacts::test
{

/// Sets XDG_DATA_HOME to a fresh folder that is removed afterwards. Not connected.
class Store : public ::testing::Test
{
protected:
    Store();
    ~Store() override;

    [[nodiscard]] std::filesystem::path databaseFile() const;
    [[nodiscard]] std::filesystem::path pictureFolder() const;
    /// Writes a file into the folder of the case and gives its path.
    std::string file(const std::string &name, const std::string &bytes) const;
    /// Runs SQL on the store, as a person with another program would.
    void sql(const std::string &text) const;
    /// Adds a contact and gives its number ids.
    std::vector<int> add(const std::string &name, const std::vector<std::string> &numbers,
                         bool joined = false);
    SavedContact save(const ContactCard &card);

    std::filesystem::path m_folder;
};

/// The same, connected for the process.
class ConnectedStore : public Store
{
protected:
    ConnectedStore() { EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE); }
    ~ConnectedStore() override { EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE); }
};

/// The text property of every record of the list; "(null)" for no value. Destroys the list.
std::vector<std::string> texts(contacts_list_h list, unsigned int property_id);

/// The integer property of every record of the list. Destroys the list.
std::vector<int> integers(contacts_list_h list, unsigned int property_id);

/// The list of all records that the filter lets through; takes the filter.
contacts_list_h query(const char *view_uri, contacts_filter_h filter);

/// A filter with one text condition.
contacts_filter_h textFilter(const char *view_uri, unsigned int property_id,
                             contacts_match_str_flag_e match, const char *value);

/// A card with one number.
ContactCard card(const std::string &name, const std::string &number);

/// The bytes of a file that counts as a PNG image, different for each letter.
std::string picture(char letter);

} // namespace pelliko::contacts::test

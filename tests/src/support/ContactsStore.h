#pragma once

#include <ContactsWriter.h>
#include <gtest/gtest.h>
#include <string>
#include <vector>

namespace pelliko::test
{

/// Adds a person; an empty name makes one without a name, `picture` is the bytes of an image, empty
/// for none.
inline void addPerson(const std::string &name, const std::vector<std::string> &numbers,
                      const std::string &picture = {})
{
    auto writer = contacts::ContactsWriter::open();
    ASSERT_TRUE(writer) << writer.error;
    contacts::ContactCard card;
    card.display_name = name;
    card.name_source = contacts::NameSource::Name;
    for (const std::string &number : numbers)
        card.numbers.push_back({number, contacts::number_cell, {}, true, false});
    card.picture = picture;
    const auto saved = writer.value->save({&card, 1});
    ASSERT_TRUE(saved) << saved.error;
}

} // namespace pelliko::test

#include "ContactsWriter.h"

#include <exception>
#include <filesystem>
#include <set>
#include <system_error>

#include <SQLiteCpp/SQLiteCpp.h>

#include "ContactRows.h"
#include "Database.h"
#include "PictureStore.h"

namespace pelliko::contacts
{
namespace
{

constexpr auto immediate = SQLite::TransactionBehavior::IMMEDIATE;

// Runs the work and gives its value, or the exception's sentence.
template <typename T, typename Work> Outcome<T> attempt(Work &&work)
{
    try {
        return {work(), {}};
    } catch (const std::bad_alloc &) {
        throw;
    } catch (const SQLite::Exception &error) {
        return {std::nullopt, std::string("the contacts store: ") + error.what()};
    } catch (const std::exception &error) {
        return {std::nullopt, error.what()};
    }
}

bool isPictureUsed(SQLite::Database &database, const std::string &path)
{
    SQLite::Statement select(database, "SELECT 1 FROM contacts WHERE image_thumbnail_path = ?");
    select.bind(1, path);
    return select.executeStep();
}

// Removes the pictures that no contact shows. Pictures are stored inside write transactions, so
// none comes into use while this one holds the lock. A file that stays behind only costs room.
void removeUnused(SQLite::Database &database, const std::set<std::string> &paths)
{
    if (paths.empty())
        return;
    const SQLite::Transaction transaction(database, immediate);
    for (const std::string &path : paths) {
        std::error_code ignored;
        if (!isPictureUsed(database, path))
            std::filesystem::remove(path, ignored);
    }
}

std::vector<SavedContact> saveAll(SQLite::Database &database, std::span<const ContactCard> cards,
                                  std::set<std::string> &pictures)
{
    std::vector<SavedContact> saved;
    saved.reserve(cards.size());
    SQLite::Transaction transaction(database, immediate);
    for (const ContactCard &card : cards) {
        std::string path;
        if (!card.picture.empty())
            pictures.insert(path = storePicture(card.picture));
        saved.push_back(saveCard(database, card, path, pictures));
    }
    transaction.commit();
    return saved;
}

std::vector<ListedNumber> listNumbers(SQLite::Database &database)
{
    SQLite::Statement select(database, select_listed_numbers);
    select.bind(1, service_book);
    std::vector<ListedNumber> numbers;
    while (select.executeStep())
        numbers.push_back({select.getColumn(0).getInt(), select.getColumn(1).getInt(),
                           select.getColumn(2).getString(), select.getColumn(3).getString(),
                           select.getColumn(4).getInt() != 0});
    return numbers;
}

} // namespace

ContactsWriter::ContactsWriter(std::unique_ptr<SQLite::Database> database)
    : m_database(std::move(database))
{
}
ContactsWriter::ContactsWriter(ContactsWriter &&) noexcept = default;
ContactsWriter &ContactsWriter::operator=(ContactsWriter &&) noexcept = default;
ContactsWriter::~ContactsWriter() = default;

Outcome<ContactsWriter> ContactsWriter::open()
{
    return attempt<ContactsWriter>([] { return ContactsWriter(openDatabase(Access::Write)); });
}

Outcome<std::vector<SavedContact>> ContactsWriter::save(std::span<const ContactCard> cards)
{
    std::set<std::string> touched;
    auto outcome =
        attempt<std::vector<SavedContact>>([&] { return saveAll(*m_database, cards, touched); });
    const auto tidy = attempt<bool>([&] { return removeUnused(*m_database, touched), true; });
    static_cast<void>(tidy);
    return outcome;
}

Outcome<bool> ContactsWriter::setServiceLetters(int number_id,
                                                const std::optional<std::string> &letters)
{
    return attempt<bool>([&] {
        SQLite::Transaction transaction(*m_database, immediate);
        const bool found = setLetters(*m_database, number_id, letters);
        transaction.commit();
        return found;
    });
}

Outcome<std::vector<ListedNumber>> ContactsWriter::numbers()
{
    return attempt<std::vector<ListedNumber>>([&] { return listNumbers(*m_database); });
}

} // namespace pelliko::contacts

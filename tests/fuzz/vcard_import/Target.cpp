// A file of vCards into the real contacts store: what is stored is whole, and comes back the same
// when it is written as a vCard again.
#include "Promise.h"
#include "Scratch.h"

#include "ContactsWriter.h"
#include "Database.h"
#include "NumberText.h"
#include "PictureStore.h"
#include "StoredCards.h"
#include "VcardCard.h"
#include "VcardImport.h"
#include "VcardText.h"
#include "VcardWriting.h"

#include <SQLiteCpp/SQLiteCpp.h>

#include <algorithm>
#include <glib.h>

using namespace pelliko::contacts;
using pelliko::fuzz::promise;

namespace
{

class Store
{
public:
    Store() : m_writer(*ContactsWriter::open().value), m_database(openDatabase(Access::Write)) {}

    ContactsWriter &writer() { return m_writer; }
    int count(const char *question) { return m_database->execAndGet(question).getInt(); }

    std::vector<ContactCard> cards()
    {
        std::vector<ContactCard> all;
        SQLite::Statement ids(*m_database, "SELECT id FROM contacts ORDER BY id");
        StoredCards stored(*m_database);
        while (ids.executeStep())
            all.push_back(*stored.read(ids.getColumn(0).getInt()));
        return all;
    }

    void empty()
    {
        m_database->exec(
            "BEGIN; DELETE FROM numbers; DELETE FROM contacts; DELETE FROM persons; COMMIT");
    }

private:
    ContactsWriter m_writer;
    std::unique_ptr<SQLite::Database> m_database;
};

Store &store()
{
    static const pelliko::fuzz::Scratch scratch;
    static Store opened;
    return opened;
}

bool isOneLine(const std::string &text)
{
    return std::none_of(text.begin(), text.end(),
                        [](char c) { return static_cast<unsigned char>(c) < ' ' || c == '\x7f'; });
}

bool isUtf8(const std::string &text)
{
    return g_utf8_validate_len(text.data(), text.size(), nullptr);
}

void promiseWhole(const ContactCard &card)
{
    promise(!card.display_name.empty(), "a contact has a name to be listed by");
    promise(isOneLine(card.display_name), "a name stands on one line");
    promise(isUtf8(card.display_name), "a name is text");
    promise(isUtf8(card.uid), "a card's own name is text");
    promise(card.picture.empty() || pictureKind(card.picture), "a picture is a picture");
    int defaults = 0;
    for (const CardNumber &number : card.numbers) {
        promise(!cleanNumber(number.number).empty(), "a number can be dialled");
        promise(isOneLine(number.number) && isUtf8(number.number), "a number is a line of text");
        promise(isOneLine(number.label) && isUtf8(number.label), "a label is a line of text");
        defaults += number.is_default ? 1 : 0;
    }
    promise(defaults <= 1, "a person has one default number");
}

void promiseReadAgain(const ContactCard &card)
{
    const std::vector<RawCard> raw = splitCards(vcardText(card));
    promise(raw.size() == 1 && raw[0].error.empty(), "a contact is written as one card");
    const auto again = readCard(raw[0].text).card;
    promise(again.has_value(), "a card that is written is read again");
    promise(again->display_name == card.display_name, "a name comes back");
    promise(again->numbers.size() == card.numbers.size(), "every number comes back");
    for (size_t i = 0; i < card.numbers.size(); ++i)
        promise(again->numbers[i].number == card.numbers[i].number, "a number comes back");
    promise(again->picture == card.picture, "a picture comes back");
}

void promiseTables()
{
    promise(store().count("SELECT count(*) FROM numbers n WHERE NOT EXISTS "
                          "(SELECT 1 FROM contacts c WHERE c.id = n.contact_id)") == 0,
            "every number belongs to a contact");
    promise(
        store().count("SELECT count(*) FROM persons p WHERE NOT EXISTS (SELECT 1 FROM contacts c "
                      "WHERE c.id = p.display_contact_id AND c.person_id = p.id)") == 0,
        "every person is shown by a contact");
}

std::vector<PlacedCard> placed(std::string_view text)
{
    std::vector<PlacedCard> cards;
    for (const RawCard &raw : splitCards(text))
        cards.push_back({"here", raw.text, raw.error});
    return cards;
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int *, char ***)
{
    const std::string plain = "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:Ann\r\nTEL:1\r\nEND:VCARD\r\n";
    const auto outcome = importCards(store().writer(), placed(plain));
    promise(outcome && outcome.value->added == 1, "cards can be read here");
    store().empty();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::vector<PlacedCard> cards = placed(pelliko::fuzz::textOf(data, size));
    const auto outcome = importCards(store().writer(), cards);
    promise(bool(outcome), "what a file holds is no reason to fail");
    const ImportReport &report = *outcome.value;
    promise(report.added + report.updated + report.skipped == cards.size(),
            "every card is stored or skipped");
    const std::vector<ContactCard> contacts = store().cards();
    promise(contacts.size() == report.added, "what was added is there");
    promiseTables();
    for (const ContactCard &card : contacts) {
        promiseWhole(card);
        promiseReadAgain(card);
    }
    if (!contacts.empty())
        store().empty();
    return 0;
}

#include "Commands.h"

#include <algorithm>
#include <iostream>

#include <nlohmann/json.hpp>

#include "ContactArguments.h"
#include "ContactsWriter.h"
#include "EvolutionBooks.h"
#include "VcardImport.h"

namespace pelliko::contacts_tool
{
namespace
{

using namespace contacts;

// Null, with the sentence in `error`, when the arguments make no contact.
std::optional<ContactCard> cardOf(const NewContact &contact, std::string &error)
{
    std::optional<ContactCard> card = namedCard(contact.name, contact.picture, error);
    if (!card || !addNumber(*card, contact.number, error))
        return std::nullopt;
    card->numbers.front().joined = contact.joined;
    return card;
}

ExitCode tell(const ImportReport &report, const std::string &source)
{
    for (const std::string &message : report.messages)
        std::cerr << "contacts-tool: " << message << '\n';
    std::cout << report.added << " added, " << report.updated << " updated, " << report.skipped
              << " skipped\n";
    if (report.added + report.updated == 0 && report.skipped > 0)
        return fail("no card of " + source + " could be imported");
    return finish();
}

void printJson(const std::vector<ListedNumber> &numbers)
{
    auto rows = nlohmann::ordered_json::array();
    for (const ListedNumber &row : numbers)
        rows.push_back({{"number_id", row.number_id},
                        {"contact_id", row.contact_id},
                        {"name", row.name},
                        {"number", row.number},
                        {"joined", row.joined}});
    constexpr int indentation = 2;
    std::cout << rows.dump(indentation, ' ', false,
                           nlohmann::ordered_json::error_handler_t::replace)
              << '\n';
}

void printTable(const std::vector<ListedNumber> &numbers)
{
    std::cout << "number id\tname\tnumber\tjoined\tcontact id\n";
    for (const ListedNumber &row : numbers)
        std::cout << row.number_id << '\t' << row.name << '\t' << row.number << '\t'
                  << (row.joined ? "yes" : "no") << '\t' << row.contact_id << '\n';
}

} // namespace

ExitCode fail(const std::string &sentence)
{
    std::cerr << "contacts-tool: " << sentence << '\n';
    return ExitCode::Failure;
}

ExitCode finish()
{
    std::cout.flush();
    return std::cout ? ExitCode::Success : fail("the output cannot be written");
}

ExitCode importFile(const std::string &path)
{
    auto writer = ContactsWriter::open();
    if (!writer)
        return fail(writer.error);
    const auto report = importVcards(*writer.value, path);
    if (!report)
        return fail(report.error);
    return tell(*report.value, path);
}

ExitCode importEvolution()
{
    const auto cards = readEvolutionBooks();
    if (!cards)
        return fail(cards.error);
    auto writer = ContactsWriter::open();
    if (!writer)
        return fail(writer.error);
    const auto report = importCards(*writer.value, *cards.value);
    return report ? tell(*report.value, "the address books") : fail(report.error);
}

ExitCode add(const NewContact &contact)
{
    std::string error;
    const std::optional<ContactCard> card = cardOf(contact, error);
    if (!card)
        return fail(error);
    auto writer = ContactsWriter::open();
    if (!writer)
        return fail(writer.error);
    const auto saved = writer.value->save({&*card, 1});
    if (!saved)
        return fail(saved.error);
    std::cout << saved.value->front().number_ids.front() << '\n';
    return finish();
}

ExitCode list(bool as_json)
{
    auto writer = ContactsWriter::open();
    if (!writer)
        return fail(writer.error);
    const auto numbers = writer.value->numbers();
    if (!numbers)
        return fail(numbers.error);
    as_json ? printJson(*numbers.value) : printTable(*numbers.value);
    return finish();
}

} // namespace pelliko::contacts_tool

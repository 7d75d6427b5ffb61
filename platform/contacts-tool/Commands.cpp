#include "Commands.h"

#include <algorithm>
#include <iostream>

#include <nlohmann/json.hpp>

#include "ContactsWriter.h"
#include "NumberText.h"
#include "PictureStore.h"
#include "VcardImport.h"

namespace pelliko::contacts_tool
{
namespace
{

using namespace contacts;

ExitCode fail(const std::string &sentence)
{
    std::cerr << "contacts-tool: " << sentence << '\n';
    return ExitCode::Failure;
}

// Output that did not reach its reader is a failure, for example on a full disk.
ExitCode finish()
{
    std::cout.flush();
    return std::cout ? ExitCode::Success : fail("the output cannot be written");
}

bool isPrintable(const std::string &text)
{
    const bool blank = text.find_first_not_of(" \t") == std::string::npos;
    return !blank && std::none_of(text.begin(), text.end(), [](char c) {
        return static_cast<unsigned char>(c) < ' ' || c == '\x7f';
    });
}

// Null, with the sentence in `error`, when the arguments make no contact.
std::optional<ContactCard> cardOf(const NewContact &contact, std::string &error)
{
    ContactCard card;
    card.display_name = contact.name;
    card.name_source = NameSource::Name;
    if (!isPrintable(contact.name)) {
        error = "the name is empty or not on one line";
        return std::nullopt;
    }
    if (!isPrintable(contact.number) || cleanNumber(contact.number).empty()) {
        error = "\"" + contact.number + "\" is not a phone number";
        return std::nullopt;
    }
    card.numbers.push_back({contact.number, number_cell, {}, true, contact.joined});
    if (contact.picture.empty())
        return card;
    auto bytes = readPictureFile(contact.picture, error);
    if (!bytes)
        return std::nullopt;
    if (!pictureKind(*bytes)) {
        error = "the picture " + contact.picture + " is not a JPEG, PNG, GIF, BMP or WebP image";
        return std::nullopt;
    }
    card.picture = std::move(*bytes);
    return card;
}

void printJson(const std::vector<ListedNumber> &numbers)
{
    auto rows = nlohmann::ordered_json::array();
    for (const ListedNumber &row : numbers)
        rows.push_back({{"number_id", row.number_id},
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
    std::cout << "number id\tname\tnumber\tjoined\n";
    for (const ListedNumber &row : numbers)
        std::cout << row.number_id << '\t' << row.name << '\t' << row.number << '\t'
                  << (row.joined ? "yes" : "no") << '\n';
}

} // namespace

ExitCode importFile(const std::string &path)
{
    auto writer = ContactsWriter::open();
    if (!writer)
        return fail(writer.error);
    const auto report = importVcards(*writer.value, path);
    if (!report)
        return fail(report.error);
    for (const std::string &message : report.value->messages)
        std::cerr << "contacts-tool: " << message << '\n';
    std::cout << report.value->added << " added, " << report.value->updated << " updated, "
              << report.value->skipped << " skipped\n";
    if (report.value->added + report.value->updated == 0)
        return fail("no card of " + path + " could be imported");
    return finish();
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

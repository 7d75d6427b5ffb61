#include "VcardImport.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <system_error>

#include "VcardCard.h"
#include "VcardText.h"

namespace pelliko::contacts
{
namespace
{

Outcome<std::string> readFile(const std::string &path)
{
    std::error_code error;
    if (std::filesystem::is_directory(path, error))
        return {std::nullopt, path + " is a folder, not a file of vCards"};
    errno = 0;
    std::ifstream file(path, std::ios::binary);
    std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    if (!file.is_open() || file.bad())
        return {std::nullopt, path + " cannot be read: " + std::generic_category().message(errno)};
    return {std::move(text), {}};
}

std::string placeOf(size_t index, const RawCard &raw)
{
    return "card " + std::to_string(index + 1) + " (line " + std::to_string(raw.line) + "): ";
}

// The cards worth keeping; the others are counted and named in the report.
std::vector<ContactCard> readCards(const std::vector<RawCard> &raw_cards, ImportReport &report)
{
    std::vector<ContactCard> cards;
    for (size_t i = 0; i < raw_cards.size(); ++i) {
        const RawCard &raw = raw_cards[i];
        const std::string place = placeOf(i, raw);
        ReadCard read;
        if (raw.error.empty())
            read = readCard(raw.text);
        else
            read.notes.push_back(raw.error);
        const char *ending = read.card ? "." : "; the card was skipped.";
        for (const std::string &note : read.notes)
            report.messages.push_back(place + note + ending);
        if (read.card)
            cards.push_back(std::move(*read.card));
        else
            ++report.skipped;
    }
    return cards;
}

} // namespace

Outcome<ImportReport> importVcards(ContactsWriter &writer, const std::string &path)
{
    const Outcome<std::string> text = readFile(path);
    if (!text)
        return {std::nullopt, text.error};
    const std::vector<RawCard> raw_cards = splitCards(*text.value);
    if (raw_cards.empty())
        return {std::nullopt, path + " holds no vCard"};
    ImportReport report;
    const std::vector<ContactCard> cards = readCards(raw_cards, report);
    const auto saved = writer.save(cards);
    if (!saved)
        return {std::nullopt, saved.error};
    for (const SavedContact &contact : *saved.value)
        ++(contact.added ? report.added : report.updated);
    return {std::move(report), {}};
}

} // namespace pelliko::contacts

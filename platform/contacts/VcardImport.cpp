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
    return "card " + std::to_string(index + 1) + " (line " + std::to_string(raw.line) + ")";
}

// The cards worth keeping; the others are counted and named in the report.
std::vector<ContactCard> readCards(const std::vector<PlacedCard> &placed_cards,
                                   ImportReport &report)
{
    std::vector<ContactCard> cards;
    for (const PlacedCard &placed : placed_cards) {
        ReadCard read;
        if (placed.error.empty())
            read = readCard(placed.text);
        else
            read.notes.push_back(placed.error);
        const char *ending = read.card ? "." : "; the card was skipped.";
        for (const std::string &note : read.notes)
            report.messages.push_back(placed.place + ": " + note + ending);
        if (read.card)
            cards.push_back(std::move(*read.card));
        else
            ++report.skipped;
    }
    return cards;
}

} // namespace

Outcome<ImportReport> importCards(ContactsWriter &writer, const std::vector<PlacedCard> &cards)
{
    ImportReport report;
    const auto saved = writer.save(readCards(cards, report));
    if (!saved)
        return {std::nullopt, saved.error};
    for (const SavedContact &contact : *saved.value)
        ++(contact.added ? report.added : report.updated);
    return {std::move(report), {}};
}

Outcome<ImportReport> importVcards(ContactsWriter &writer, const std::string &path)
{
    const Outcome<std::string> text = readFile(path);
    if (!text)
        return {std::nullopt, text.error};
    std::vector<PlacedCard> cards;
    for (RawCard &raw : splitCards(*text.value)) {
        const std::string place = placeOf(cards.size(), raw);
        cards.push_back({place, std::move(raw.text), std::move(raw.error)});
    }
    if (cards.empty())
        return {std::nullopt, path + " holds no vCard"};
    return importCards(writer, cards);
}

} // namespace pelliko::contacts

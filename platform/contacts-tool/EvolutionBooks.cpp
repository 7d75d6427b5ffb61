#include "EvolutionBooks.h"

#ifdef PELLIKO_WITH_EVOLUTION

#include <memory>

#include <libebook/libebook.h>

namespace pelliko::contacts_tool
{
namespace
{

using contacts::Outcome;
using contacts::PlacedCard;

constexpr const char *every_card = "(contains \"x-evolution-any-field\" \"\")";
constexpr guint connect_seconds = 30; ///< at most, until a book of another machine is loaded

template <typename T> using Owned = std::unique_ptr<T, void (*)(gpointer)>;

void freeSources(gpointer list)
{
    g_list_free_full(static_cast<GList *>(list), g_object_unref);
}

void freeContacts(gpointer list)
{
    g_slist_free_full(static_cast<GSList *>(list), g_object_unref);
}

std::string sentenceOf(GError *error)
{
    const std::unique_ptr<GError, decltype(&g_error_free)> owned(error, g_error_free);
    return owned ? owned->message : "no reason is given";
}

// Every card of the book: each has some field that contains the empty text.
std::string readBook(ESource *source, std::vector<PlacedCard> &cards)
{
    const std::string book = std::string("the address book ") + e_source_get_display_name(source);
    GError *error = nullptr;
    const Owned<EClient> client(
        e_book_client_connect_sync(source, connect_seconds, nullptr, &error), g_object_unref);
    if (!client)
        return book + " cannot be opened: " + sentenceOf(error);
    GSList *read = nullptr;
    if (!e_book_client_get_contacts_sync(E_BOOK_CLIENT(client.get()), every_card, &read, nullptr,
                                         &error))
        return book + " cannot be read: " + sentenceOf(error);
    const Owned<GSList> contacts(read, freeContacts);
    for (const GSList *at = contacts.get(); at; at = at->next) {
        const Owned<char> text(e_vcard_to_string(E_VCARD(at->data), EVC_FORMAT_VCARD_30), g_free);
        const auto *name = static_cast<const char *>(
            e_contact_get_const(E_CONTACT(at->data), E_CONTACT_FULL_NAME));
        cards.push_back({book + ", " + (name ? name : "a card without a name"), text.get(), {}});
    }
    return {};
}

} // namespace

Outcome<std::vector<PlacedCard>> readEvolutionBooks()
{
    GError *error = nullptr;
    const Owned<ESourceRegistry> registry(e_source_registry_new_sync(nullptr, &error),
                                          g_object_unref);
    if (!registry)
        return {std::nullopt, "Evolution Data Server cannot be reached: " + sentenceOf(error)};
    const Owned<GList> books(
        e_source_registry_list_enabled(registry.get(), E_SOURCE_EXTENSION_ADDRESS_BOOK),
        freeSources);
    std::vector<PlacedCard> cards;
    for (const GList *at = books.get(); at; at = at->next) {
        const std::string problem = readBook(E_SOURCE(at->data), cards);
        if (!problem.empty())
            return {std::nullopt, problem};
    }
    return {std::move(cards), {}};
}

} // namespace pelliko::contacts_tool

#else

namespace pelliko::contacts_tool
{

contacts::Outcome<std::vector<contacts::PlacedCard>> readEvolutionBooks()
{
    return {std::nullopt, "this program was built without Evolution Data Server"};
}

} // namespace pelliko::contacts_tool

#endif

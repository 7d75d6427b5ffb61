// How long the application's look-ups take in a small and in a large contacts store.
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <random>

#include <benchmark/benchmark.h>

#include "ContactsWriter.h"
#include "Ratios.h"
#include "contacts.h"
#include "contacts_ex.h"

namespace
{

using namespace pelliko::contacts;

constexpr int small = 500, large = 50000;

[[noreturn]] void giveUp(const std::string &reason)
{
    std::fprintf(stderr, "contacts-lookup: %s\n", reason.c_str());
    std::exit(2);
}

std::string numberOf(int person)
{
    char text[32];
    std::snprintf(text, sizeof text, "+4915%08d", person * 1999 % 100000000);
    return text;
}

std::vector<ContactCard> people(int count)
{
    std::vector<ContactCard> cards(static_cast<size_t>(count));
    for (int i = 0; i < count; ++i) {
        ContactCard &card = cards[static_cast<size_t>(i)];
        card.uid = "person-" + std::to_string(i);
        card.display_name = "Person " + std::to_string(i);
        card.name_source = NameSource::Name;
        card.numbers.push_back({numberOf(i), number_cell, {}, false, i % 3 == 0});
    }
    return cards;
}

// A store of its own for each size, removed at the end.
class Stores
{
public:
    Stores()
    {
        std::string folder = (std::filesystem::temp_directory_path() / "bench-XXXXXX").string();
        if (!mkdtemp(folder.data()))
            giveUp("cannot make a folder for the stores");
        folder_ = folder;
    }
    ~Stores() { std::filesystem::remove_all(folder_); }
    Stores(const Stores &) = delete;
    Stores &operator=(const Stores &) = delete;

    // Makes the store of `count` people the one that is connected; gives its number ids.
    const std::vector<int> &open(int count)
    {
        setenv("XDG_DATA_HOME", (folder_ / std::to_string(count)).c_str(), 1);
        auto &ids = ids_[count];
        if (ids.empty())
            fill(count, ids);
        if (contacts_connect() != CONTACTS_ERROR_NONE)
            giveUp("cannot open the store");
        return ids;
    }

private:
    static void fill(int count, std::vector<int> &ids)
    {
        auto writer = ContactsWriter::open();
        if (!writer)
            giveUp(writer.error);
        const auto saved = writer.value->save(people(count));
        if (!saved)
            giveUp(saved.error);
        for (const SavedContact &contact : *saved.value)
            ids.push_back(contact.number_ids.front());
    }

    std::filesystem::path folder_;
    std::map<int, std::vector<int>> ids_;
};

Stores &stores()
{
    static Stores all;
    return all;
}

// The same people in the same order in every run.
class Dice
{
public:
    explicit Dice(size_t count) : place_(0, count - 1) {}
    size_t next() { return place_(engine_); }

private:
    std::mt19937 engine_{4711};
    std::uniform_int_distribution<size_t> place_;
};

contacts_record_h record(const char *view, int id)
{
    contacts_record_h found = nullptr;
    if (contacts_db_get_record(view, id, &found) != CONTACTS_ERROR_NONE)
        giveUp("a record is missing");
    return found;
}

int integerOf(contacts_record_h found, unsigned property)
{
    int value = 0;
    contacts_record_get_int(found, property, &value);
    return value;
}

// A recipient: the number, its contact, the person and whether the number has joined.
void lookUpNumberId(int id)
{
    contacts_record_h number = record(_contacts_number._uri, id);
    contacts_record_h contact =
        record(_contacts_simple_contact._uri, integerOf(number, _contacts_number.contact_id));
    contacts_record_h person =
        record(_contacts_person._uri, integerOf(contact, _contacts_simple_contact.person_id));
    for (contacts_record_h done : {number, contact, person})
        contacts_record_destroy(done, true);
}

// The first record of a query, as a sender is looked for.
void lookUpNumber(const std::string &text)
{
    contacts_filter_h filter = nullptr;
    contacts_query_h query = nullptr;
    contacts_list_h list = nullptr;
    contacts_filter_create(_contacts_person_number._uri, &filter);
    contacts_filter_add_str(filter, _contacts_person_number.number, CONTACTS_MATCH_CONTAINS,
                            text.c_str());
    contacts_query_create(_contacts_person_number._uri, &query);
    contacts_query_set_filter(query, filter);
    contacts_db_get_records_with_query(query, 0, 0, &list);
    contacts_record_h found = nullptr;
    if (contacts_list_get_current_record_p(list, &found) != CONTACTS_ERROR_NONE || !found)
        giveUp("nobody has the number " + text);
    contacts_list_destroy(list, true);
    contacts_query_destroy(query);
    contacts_filter_destroy(filter);
}

void byNumberId(benchmark::State &state)
{
    const auto &ids = stores().open(static_cast<int>(state.range(0)));
    Dice dice(ids.size());
    for (auto _ : state)
        lookUpNumberId(ids[dice.next()]);
    contacts_disconnect();
}

void byNumber(benchmark::State &state)
{
    const auto &ids = stores().open(static_cast<int>(state.range(0)));
    Dice dice(ids.size());
    for (auto _ : state)
        lookUpNumber(numberOf(static_cast<int>(dice.next())));
    contacts_disconnect();
}

BENCHMARK(byNumberId)->Arg(small)->Arg(large)->Unit(benchmark::kMicrosecond);
BENCHMARK(byNumber)->Arg(small)->Arg(large)->Unit(benchmark::kMicrosecond);

} // namespace

int main(int argc, char **argv)
{
    return pelliko::bench::runAndCompare(
        argc, argv,
        {{"byNumberId/50000", "byNumberId/500", 1.5}, {"byNumber/50000", "byNumber/500", 1.5}});
}

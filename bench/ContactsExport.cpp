// How long the export of contacts takes next to the vCard library alone.
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>
#include <libebook-contacts/libebook-contacts.h>

#include "ContactsWriter.h"
#include "Ratios.h"
#include "contacts_service_helper.h"

using namespace pelliko::contacts;

namespace
{

constexpr int exported_contacts = 5000;

ContactCard cardOf(int number)
{
    ContactCard card;
    card.display_name = "Person Number " + std::to_string(number);
    card.name_source = NameSource::Name;
    card.uid = "urn:uuid:" + std::to_string(number);
    card.numbers.push_back({"+49 151 " + std::to_string(10000000 + number * 7919 % 89999999),
                            number_cell,
                            {},
                            true,
                            false});
    card.numbers.push_back(
        {"+49 30 " + std::to_string(20000000 + number), number_work, {}, false, false});
    return card;
}

std::vector<SavedContact> fill(const std::string &folder, const std::vector<ContactCard> &cards)
{
    setenv("XDG_DATA_HOME", folder.c_str(), 1);
    auto writer = ContactsWriter::open();
    auto saved = writer ? writer.value->save(cards) : Outcome<std::vector<SavedContact>>{};
    if (!saved) {
        std::fprintf(stderr, "contacts-export: the store cannot be filled: %s\n",
                     saved.error.c_str());
        std::exit(2);
    }
    return std::move(*saved.value);
}

void addNumber(EVCard *card, const CardNumber &number)
{
    EVCardAttribute *attribute = e_vcard_attribute_new(nullptr, EVC_TEL);
    EVCardAttributeParam *type = e_vcard_attribute_param_new(EVC_TYPE);
    e_vcard_attribute_add_param_with_value(attribute, type,
                                           number.type == number_cell ? "CELL" : "WORK");
    if (number.is_default)
        e_vcard_attribute_param_add_value(type, "PREF");
    e_vcard_append_attribute_with_value(card, attribute, number.number.c_str());
}

// The same cards by the library alone, from memory.
void writeDirectly(const std::vector<ContactCard> &cards, const std::string &path)
{
    std::ofstream out(path, std::ios::binary);
    for (const ContactCard &card : cards) {
        EVCard *vcard = e_vcard_new();
        e_vcard_append_attribute_with_value(vcard, e_vcard_attribute_new(nullptr, EVC_FN),
                                            card.display_name.c_str());
        e_vcard_append_attribute_with_values(vcard, e_vcard_attribute_new(nullptr, EVC_N), "",
                                             card.display_name.c_str(), "", "", "", nullptr);
        for (const CardNumber &number : card.numbers)
            addNumber(vcard, number);
        e_vcard_append_attribute_with_value(vcard, e_vcard_attribute_new(nullptr, EVC_UID),
                                            card.uid.c_str());
        char *text = e_vcard_to_string(vcard, EVC_FORMAT_VCARD_30);
        out << text << "\r\n";
        g_free(text);
        g_object_unref(vcard);
    }
}

bool goOn(const char *, int, void *)
{
    return true;
}

void exportAll(const std::vector<SavedContact> &contacts, const std::string &directory)
{
    std::vector<std::string> texts;
    for (const SavedContact &contact : contacts)
        texts.push_back(std::to_string(contact.contact_id));
    std::vector<char *> ids;
    for (std::string &text : texts)
        ids.push_back(text.data());
    if (contacts_service_helper_create_vcard_files(
            directory.c_str(), ids.data(), static_cast<int>(ids.size()), 0, goOn, nullptr) != 0)
        std::exit(2);
}

std::string contentOf(const std::string &path)
{
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

struct Fixture {
    Fixture()
    {
        folder = (std::filesystem::temp_directory_path() / "bench-XXXXXX").string();
        if (!mkdtemp(folder.data()))
            std::exit(2);
        for (int i = 0; i < exported_contacts; ++i)
            cards.push_back(cardOf(i));
        contacts = fill(folder, cards);
        writeDirectly(cards, folder + "/direct.vcf");
        exportAll(contacts, folder + "/");
        if (contentOf(folder + "/direct.vcf") != contentOf(folder + "/contacts.vcf")) {
            std::fprintf(stderr, "contacts-export: the two ways write different cards\n");
            std::exit(2);
        }
    }
    ~Fixture() { std::filesystem::remove_all(folder); }
    Fixture(const Fixture &) = delete;
    Fixture &operator=(const Fixture &) = delete;

    std::string folder;
    std::vector<ContactCard> cards;
    std::vector<SavedContact> contacts;
};

Fixture &fixture()
{
    static Fixture made;
    return made;
}

void libraryAlone(benchmark::State &state)
{
    const Fixture &of = fixture();
    for (auto _ : state)
        writeDirectly(of.cards, of.folder + "/direct.vcf");
}

void exportOfTheStore(benchmark::State &state)
{
    const Fixture &of = fixture();
    for (auto _ : state) {
        std::filesystem::remove(of.folder + "/contacts.vcf");
        exportAll(of.contacts, of.folder + "/");
    }
}

BENCHMARK(libraryAlone)->Unit(benchmark::kMillisecond);
BENCHMARK(exportOfTheStore)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char **argv)
{
    return pelliko::bench::runAndCompare(argc, argv, {{"exportOfTheStore", "libraryAlone", 1.3}});
}

#pragma once

#include <fstream>
#include <iterator>
#include <set>

#include <JsonValue.h>
#include <glib.h>

#include "ContactsFixture.h"
#include "contacts_service_helper.h"

namespace pelliko::contacts::test
{

using Names = std::vector<std::string>;
using pelliko::test::JsonValue;

/// A store and a directory to export to, whose files another implementation reads back.
class VcardExport : public Store
{
protected:
    VcardExport() { std::filesystem::create_directory(m_folder / "out"); }

    struct Calls {
        Names names;
        std::vector<int> counts;
        size_t stop_after = SIZE_MAX;
    };

    static bool note(const char *file_name, int progress_count, void *user_data)
    {
        auto &calls = *static_cast<Calls *>(user_data);
        calls.names.emplace_back(file_name);
        calls.counts.push_back(progress_count);
        return calls.names.size() < calls.stop_after;
    }

    [[nodiscard]] std::string directory() const { return m_folder / "out/"; }

    int exported(std::vector<std::string> ids, int share_mode, Calls &calls) const
    {
        std::vector<char *> list;
        for (std::string &id : ids)
            list.push_back(id.data());
        return contacts_service_helper_create_vcard_files(directory().c_str(), list.data(),
                                                          static_cast<int>(list.size()), share_mode,
                                                          note, &calls);
    }
    Names exported(const std::vector<std::string> &ids, int share_mode) const
    {
        Calls calls;
        EXPECT_EQ(exported(ids, share_mode, calls), CONTACTS_ERROR_NONE);
        return calls.names;
    }

    /// All names in the directory, hidden ones too.
    [[nodiscard]] std::set<std::string> left() const
    {
        std::set<std::string> names;
        for (const auto &entry : std::filesystem::directory_iterator(directory()))
            names.insert(entry.path().filename());
        return names;
    }

    [[nodiscard]] std::string text(const std::string &name) const
    {
        std::ifstream in(directory() + name, std::ios::binary);
        return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    }

    /// What python3-vobject reads.
    [[nodiscard]] JsonValue readBack(const std::string &name) const
    {
        const std::string path = directory() + name;
        const char *words[] = {"/usr/bin/python3",
                               PELLIKO_SOURCE_DIR "/tests/platform/contacts/read_vcards.py",
                               path.c_str(), nullptr};
        char *out = nullptr;
        EXPECT_TRUE(g_spawn_sync(nullptr, const_cast<char **>(words), nullptr, G_SPAWN_DEFAULT,
                                 nullptr, nullptr, &out, nullptr, nullptr, nullptr));
        const std::unique_ptr<char, decltype(&g_free)> owned(out, g_free);
        return JsonValue::parse(out);
    }

    static std::string sumOf(const std::string &bytes)
    {
        const std::unique_ptr<char, decltype(&g_free)> sum(
            g_compute_checksum_for_string(G_CHECKSUM_SHA256, bytes.data(),
                                          static_cast<gssize>(bytes.size())),
            g_free);
        return sum.get();
    }

    std::string addContact(const ContactCard &contact)
    {
        return std::to_string(save(contact).contact_id);
    }
};

} // namespace pelliko::contacts::test

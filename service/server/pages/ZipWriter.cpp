#include "pages/ZipWriter.h"

#include <archive.h>
#include <archive_entry.h>

#include <stdexcept>
#include <sys/stat.h>
#include <utility>

namespace pelliko::server
{

struct ZipWriter::State {
    struct archive *archive = archive_write_new();
    std::string output;

    void check(int result) const
    {
        if (result != ARCHIVE_OK)
            throw std::runtime_error(std::string("zip: ") + archive_error_string(archive));
    }
};

ZipWriter::ZipWriter() : m_state(std::make_unique<State>())
{
    const auto append = [](struct archive *, void *state, const void *bytes,
                           std::size_t size) -> la_ssize_t {
        static_cast<State *>(state)->output.append(static_cast<const char *>(bytes), size);
        return static_cast<la_ssize_t>(size);
    };
    struct archive *archive = m_state->archive;
    m_state->check(archive_write_set_format_zip(archive));
    m_state->check(archive_write_zip_set_compression_store(archive));
    m_state->check(archive_write_set_bytes_per_block(archive, 0));
    m_state->check(archive_write_open(archive, m_state.get(), nullptr, append, nullptr));
}

ZipWriter::~ZipWriter()
{
    // Freeing writes the end of an archive that was not closed; nobody takes it any more.
    archive_write_free(m_state->archive);
}

void ZipWriter::beginFile(const std::string &name, std::uint64_t size, std::int64_t modified)
{
    const std::unique_ptr<archive_entry, decltype(&archive_entry_free)> entry(archive_entry_new(),
                                                                              archive_entry_free);
    archive_entry_set_pathname_utf8(entry.get(), name.c_str());
    archive_entry_set_size(entry.get(), static_cast<la_int64_t>(size));
    archive_entry_set_filetype(entry.get(), AE_IFREG);
    archive_entry_set_perm(entry.get(), 0644);
    archive_entry_set_mtime(entry.get(), modified, 0);
    m_state->check(archive_write_header(m_state->archive, entry.get()));
}

void ZipWriter::add(std::string_view bytes)
{
    const la_ssize_t written = archive_write_data(m_state->archive, bytes.data(), bytes.size());
    if (written != static_cast<la_ssize_t>(bytes.size()))
        throw std::runtime_error("zip: more bytes than announced");
}

void ZipWriter::close()
{
    m_state->check(archive_write_close(m_state->archive));
}

std::string ZipWriter::takeOutput()
{
    return std::exchange(m_state->output, {});
}

} // namespace pelliko::server

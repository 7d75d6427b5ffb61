#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace pelliko::server
{

/// Makes a zip piece by piece: files are stored, not packed, since photos do not get smaller. Needs
/// a UTF-8 locale for names. Throws std::runtime_error.
class ZipWriter
{
public:
    ZipWriter();
    ~ZipWriter();
    ZipWriter(const ZipWriter &) = delete;
    ZipWriter &operator=(const ZipWriter &) = delete;

    /// Starts the next file; exactly `size` bytes are to be added.
    void beginFile(const std::string &name, std::uint64_t size, std::int64_t modified);
    void add(std::string_view bytes);
    /// After the last file: writes the directory.
    void close();

    /// What has been made since the last call.
    [[nodiscard]] std::string takeOutput();

private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace pelliko::server

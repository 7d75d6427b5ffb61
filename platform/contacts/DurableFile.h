// Writing files that are there whole or not at all.
#pragma once

#include <string>
#include <string_view>

namespace pelliko::contacts
{

/// Owns a file descriptor.
class File
{
public:
    explicit File(int descriptor) : m_descriptor(descriptor) {}
    ~File() { close(); }
    File(const File &) = delete;
    File &operator=(const File &) = delete;

    /// Closes what is open and takes another descriptor.
    void reset(int descriptor)
    {
        close();
        m_descriptor = descriptor;
    }

    [[nodiscard]] int descriptor() const { return m_descriptor; }
    /// False when the last of the data did not reach the file.
    bool close();

private:
    int m_descriptor;
};

/// False, with errno set, when not all of it could be written.
bool writeAll(int descriptor, std::string_view bytes);

/// Makes the renames in the folder durable. Throws std::system_error.
void syncFolder(const std::string &folder);

/// Puts the bytes under the name, in place of what is there; on disk when it returns. The file is
/// for its owner alone. Throws std::system_error, leaving what was there.
void replaceFile(const std::string &folder, const std::string &name, std::string_view bytes);

} // namespace pelliko::contacts

// vCard files that appear in a folder all together, whole and under names of their own.
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "DurableFile.h"

namespace pelliko::contacts
{

/// A person's name as the name of a file, without the ending: one component, not hidden, of at most
/// 100 bytes, and without what lists of files or other systems use as separators. "contact" when
/// nothing is left.
std::string fileStem(const std::string &name);

/// Files are written into a hidden folder beside their place first. What was not published is
/// removed with the object, and by the next one for the directory when a program ended amid an
/// export. Everything throws std::system_error.
class ExportFiles
{
public:
    /// The directory must be there.
    explicit ExportFiles(std::string directory);
    ~ExportFiles();
    ExportFiles(const ExportFiles &) = delete;
    ExportFiles &operator=(const ExportFiles &) = delete;

    /// Begins the next file; the text goes into it until the next begin() or finish().
    void begin(std::string stem);
    void write(std::string_view text);
    /// Everything that was written is on disk when it returns.
    void finish();

    [[nodiscard]] size_t count() const { return m_stems.size(); }

    /// Gives a finished file its place and returns its name in the directory: "STEM.vcf", or
    /// "STEM (2).vcf" and so on where that is taken. Nothing is ever replaced.
    std::string publish(size_t index);

private:
    [[nodiscard]] std::string stagedPath(size_t index) const;
    void flush();
    void makeStaging();

    std::string m_directory;
    std::string m_staging;
    File m_staging_lock{-1}; ///< says that the hidden folder is in use
    std::vector<std::string> m_stems;
    std::map<std::string, int> m_next_number; ///< of a stem, so that many namesakes stay quick
    std::string m_buffer;
    File m_file{-1};
};

} // namespace pelliko::contacts

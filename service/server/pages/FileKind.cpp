#include "pages/FileKind.h"

#include <algorithm>
#include <string>

namespace pelliko::server
{
namespace
{

struct KindOfExtensions {
    FileKind kind;
    /// Each between blanks.
    std::string_view extensions;
};

constexpr KindOfExtensions byExtension[] = {
    {FileKind::picture, " jpg jpeg png gif agif webp bmp wbmp heic heif avif tif tiff svg "},
    {FileKind::video,
     " mp4 m4v mov mkv webm avi 3gp 3gpp 3g2 3gpp2 mpg mpeg ts m2ts mts m2t tp trp "
     "wmv asf flv divx ram rm rmvb ogv "},
    {FileKind::sound,
     " mp3 mpga m4a aac ogg oga opus wav flac amr awb 3ga wma mka mid midi xmf mxmf "
     "smf imy rtx ota rtttl qcp evc pva "},
    {FileKind::text, " txt log md "},
    {FileKind::contact, " vcf "},
    {FileKind::document,
     " pdf doc docx xls xlsx ppt pptx odt ods odp rtf csv htm html epub hwp gul vcs vts ics "},
    {FileKind::archive, " zip 7z rar tar gz tgz bz2 xz zst "},
};

struct KindOfType {
    std::string_view begin;
    FileKind kind;
};

constexpr KindOfType byType[] = {
    {"image/", FileKind::picture},
    {"video/", FileKind::video},
    {"audio/", FileKind::sound},
    {"text/plain", FileKind::text},
    {"text/vcard", FileKind::contact},
    {"text/x-vcard", FileKind::contact},
    {"text/", FileKind::document},
    {"application/pdf", FileKind::document},
    {"application/zip", FileKind::archive},
};

std::string lowerCase(std::string_view text)
{
    std::string lower(text);
    std::transform(lower.begin(), lower.end(), lower.begin(), [](char c) {
        return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    });
    return lower;
}

FileKind kindOfExtension(std::string_view extension)
{
    const std::string wanted = " " + lowerCase(extension) + " ";
    for (const KindOfExtensions &entry : byExtension) {
        if (entry.extensions.find(wanted) != std::string_view::npos)
            return entry.kind;
    }
    return FileKind::other;
}

FileKind kindOfType(std::string_view type)
{
    const std::string lower = lowerCase(type);
    for (const KindOfType &entry : byType) {
        if (lower.rfind(entry.begin, 0) == 0)
            return entry.kind;
    }
    return FileKind::other;
}

} // namespace

FileKind kindOf(std::string_view name, std::string_view type)
{
    const auto dot = name.rfind('.');
    const bool hasExtension = dot != std::string_view::npos && dot + 1 < name.size() &&
                              name.find(' ', dot) == std::string_view::npos;
    return hasExtension ? kindOfExtension(name.substr(dot + 1)) : kindOfType(type);
}

const char *wordFor(FileKind kind)
{
    switch (kind) {
    case FileKind::picture:
        return "Picture";
    case FileKind::video:
        return "Video";
    case FileKind::sound:
        return "Sound";
    case FileKind::text:
        return "Text";
    case FileKind::contact:
        return "Contact";
    case FileKind::document:
        return "Document";
    case FileKind::archive:
        return "Archive";
    case FileKind::other:
        break;
    }
    return "File";
}

} // namespace pelliko::server

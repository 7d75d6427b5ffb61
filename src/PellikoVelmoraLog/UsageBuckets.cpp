#include "PellikoVelmoraLog/UsageBuckets.h"

#include <cstring>
#include <iterator>

namespace pelliko
{

namespace
{

constexpr const char *ownAppId = "com.velmora.pelliko";
constexpr uint32_t megabyte = 1048576;

struct KindRows {
    int first, last;
    const char *kind;
};

// A plain text is what the application makes of a shared memo.
constexpr KindRows kinds[] = {
    {0, 24, "Video"}, {25, 56, "Audio"},    {57, 64, "Photo"},   {65, 73, "Document"},
    {74, 74, "Memo"}, {75, 76, "Document"}, {77, 77, "Contact"}, {78, 79, "Kalendo"},
};

constexpr const char *reasons[] = {"size_exceeded_once", "size_exceeded_day", "not_supported_files",
                                   "file_count"};

} // namespace

const char *_shareViaTo(int recipient_count, const char *ct_app_id)
{
    if (recipient_count == 0)
        return nullptr;
    const bool personal = recipient_count == 1;
    if (ct_app_id && strcmp(ct_app_id, ownAppId) == 0)
        return personal ? "Contacts_personal" : "Contacts_group";
    return personal ? "Recent_personal" : "Recent_group";
}

const char *_contentKind(int row)
{
    for (const KindRows &rows : kinds) {
        if (row >= rows.first && row <= rows.last)
            return rows.kind;
    }
    return nullptr;
}

const char *_fileCountBucket(int file_count)
{
    const auto count = static_cast<uint32_t>(file_count);
    if (count == 0 || count > 100)
        return nullptr;
    if (count <= 10)
        return "1_10";
    return count <= 50 ? "11_50" : "51_100";
}

const char *_fileSizeBucket(uint32_t file_size)
{
    if (file_size < 100 * megabyte)
        return "0_100MB";
    if (file_size < 500 * megabyte)
        return "100MB_500MB";
    return file_size <= 1024 * megabyte ? "500MB_1GB" : nullptr;
}

const char *_rejectReason(int reason)
{
    const bool known = reason >= 0 && reason < static_cast<int>(std::size(reasons));
    return known ? reasons[reason] : nullptr;
}

} // namespace pelliko

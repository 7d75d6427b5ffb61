#pragma once

#include <JsonValue.h>
#include <filesystem>
#include <glib.h>
#include <string>
#include <vector>

namespace pelliko::test
{

/// The file that the usage log keeps for the user of this world.
inline std::filesystem::path usageFile()
{
    return std::filesystem::path(g_get_user_state_dir()) / "velmora" / "usage.jsonl";
}

/// What the trace says before a record is made: usageLine("PK01 [Pelliko_Share via]").
inline std::string usageLine(const std::string &feature, const std::string &extra = "(null)")
{
    return "type: 0, feature: " + feature + ", extra: " + extra + ", value: (null)\n";
}

/// The usage records that were made from here on.
class UsageRecords
{
public:
    UsageRecords() { std::filesystem::remove(usageFile()); }

    /// Every record as it stands in the file.
    std::vector<JsonValue> all() const { return JsonValue::linesOf(usageFile()); }

    /// "PK05 1_10", or "PK01" for a record without extra, in order.
    std::vector<std::string> features() const
    {
        std::vector<std::string> texts;
        for (const JsonValue &record : all()) {
            std::string text = record["feature"].text();
            if (record.contains("extra"))
                text += " " + record["extra"].text();
            texts.push_back(text);
        }
        return texts;
    }
};

} // namespace pelliko::test

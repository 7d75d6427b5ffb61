#include "Icons.h"

#include <array>
#include <filesystem>
#include <string>

namespace pelliko::quickpanel
{
namespace
{

struct Rule {
    const char *word;
    const char *icon;
};

// The first word that occurs in the picture's name decides.
constexpr std::array<Rule, 7> pictures{{
    {"caller_id", "avatar-default"},
    {"fail", "dialog-error"},
    {"error", "dialog-error"},
    {"upload_complete", "pelliko-upload-complete"},
    {"upload", "pelliko-upload"},
    {"download", "document-save"},
    {"receiv", "document-save"},
}};

constexpr int uploadFrames = 4;

template <typename Rules> std::string lookUp(const Rules &rules, const std::string &name)
{
    for (const Rule &rule : rules)
        if (name.find(rule.word) != std::string::npos)
            return rule.icon;
    return "dialog-information";
}

bool startsWith(const std::string &text, const char *start)
{
    return text.rfind(start, 0) == 0;
}

bool exists(const std::string &path)
{
    std::error_code ignored;
    return std::filesystem::exists(path, ignored);
}

} // namespace

std::string drawableIcon(const std::string &image)
{
    // A picture of the handset's panel, animated or not, stands for the still icon of the same
    // name.
    if (startsWith(image, "reserved:"))
        return lookUp(pictures, image);
    if (image.empty() || image.find('/') == std::string::npos || exists(image))
        return image;
    return lookUp(pictures, std::filesystem::path(image).filename());
}

std::string movingIcon(const std::string &image, int percent)
{
    const std::string icon = drawableIcon(image);
    const bool animated =
        startsWith(image, "reserved:") && image.find("/ani/") != std::string::npos;
    return animated && icon == "pelliko-upload"
               ? "pelliko-uploading-" + std::to_string(percent % uploadFrames + 1)
               : icon;
}

} // namespace pelliko::quickpanel

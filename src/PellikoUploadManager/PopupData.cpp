#include "PellikoUploadManager/PopupData.h"

#include "PellikoApp/Decimal.h"
#include "PellikoApp/TextFormat.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace pelliko
{

std::array<char, popupDataSize> popupDataText(const PopupData &data)
{
    const PlainNumbers plain;
    std::array<char, popupDataSize> text{};
    snprintf(text.data(), text.size(), "%d+%f+%d", data.status, data.progress_percent,
             data.error_code);
    return text;
}

PopupData parsePopupData(char *text)
{
    const PlainNumbers plain;
    PopupData data;
    if (!text)
        return data;
    char *rest = nullptr;
    if (const char *token = strtok_r(text, "+", &rest))
        data.status = decimalValue(token);
    if (const char *token = strtok_r(nullptr, "+", &rest))
        data.progress_percent = strtod(token, nullptr);
    if (const char *token = strtok_r(nullptr, "+", &rest))
        data.error_code = decimalValue(token);
    return data;
}

} // namespace pelliko

// The text by which a status is handed to the uploading-status popup: any text is read, and what is
// written is read again as it was, as far as it fits.
#include "Promise.h"

#include "PellikoUploadManager/PopupData.h"

#include <cmath>
#include <cstring>
#include <string>

using namespace pelliko;
using pelliko::fuzz::promise;

namespace
{

PopupData parsed(std::string text)
{
    return parsePopupData(text.data());
}

void tryFigures(const uint8_t *data, size_t size)
{
    PopupData figures;
    if (size < sizeof(figures.status) + sizeof(figures.error_code) + sizeof(double))
        return;
    std::memcpy(&figures.status, data, sizeof(figures.status));
    std::memcpy(&figures.error_code, data + 4, sizeof(figures.error_code));
    std::memcpy(&figures.progress_percent, data + 8, sizeof(double));
    const auto text = popupDataText(figures);
    const size_t length = std::strlen(text.data());
    const PopupData again = parsed(text.data());
    promise(again.status == figures.status, "the status always fits");
    if (length == text.size() - 1 || !std::isfinite(figures.progress_percent))
        return;
    promise(again.error_code == figures.error_code, "the error is read as it was written");
    promise(std::abs(again.progress_percent - figures.progress_percent) < 1e-6,
            "the percentage is read to six decimals");
}

void tryText(const std::string &text)
{
    const PopupData data = parsed(text);
    const PopupData again = parsed(popupDataText(data).data());
    promise(again.status == data.status, "a status that was read is written the same");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    tryText(std::string(pelliko::fuzz::textOf(data, size)));
    tryFigures(data, size);
    return 0;
}

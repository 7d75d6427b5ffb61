#include "Words.h"

#include <Formats.h>
#include <Language.h>

namespace pelliko::viewer
{

using companion::counted;
using companion::filledIn;
using companion::translated;

namespace
{

std::string stateOf(const companion::ShareFile &file, const FileState &state)
{
    switch (state.kind) {
    case FileState::Kind::waiting:
        return translated("Waits for its turn");
    case FileState::Kind::saving: {
        const int64_t percent = file.size > 0 ? state.done * 100 / file.size : 0;
        return filledIn("Being saved, %s", std::to_string(percent) + " %");
    }
    case FileState::Kind::saved:
        return translated("Saved. Press to open");
    default:
        return translated("Press to save");
    }
}

} // namespace

std::string titleText(const companion::ReceivedShare &share)
{
    return share.sender.empty() ? translated("Somebody shared with you")
                                : filledIn("%s shared with you", share.sender);
}

std::string summaryText(const companion::ReceivedShare &share)
{
    std::string text =
        counted("%d file", "%d files", share.files.size()) + ", " + companion::sizeText(share.size);
    if (share.expires <= 0 || share.state == PELLIKO_SHARE_WITHDRAWN)
        return text;
    // Translators give the order of day, month and year that their readers expect.
    const std::string date = companion::dateText(share.expires, translated("%Y-%m-%d %H:%M"));
    return text + "\n" +
           (share.state == PELLIKO_SHARE_EXPIRED ? filledIn("Expired on %s", date)
                                                 : filledIn("Available until %s", date));
}

std::string faultText(int code)
{
    switch (code) {
    case 0:
        return {};
    case PELLIKO_SHARES_ERROR_NOT_FOUND:
    case PELLIKO_SHARES_ERROR_INVALID_PARAMETER:
        return translated("There is no such share. It may have been removed.");
    case PELLIKO_SHARES_ERROR_EXPIRED:
        return translated("The time of this share is over, and its files are gone. Ask the sender "
                          "to share them again.");
    case PELLIKO_SHARES_ERROR_WITHDRAWN:
        return translated("The sender has withdrawn this share. Its files cannot be fetched any "
                          "more.");
    case PELLIKO_SHARES_ERROR_UNREACHABLE:
        return translated("The share server cannot be reached. Check your connection and try "
                          "again.");
    case PELLIKO_SHARES_ERROR_REFUSED:
        return translated("The server refuses. Check that you are signed in.");
    case PELLIKO_SHARES_ERROR_NO_SPACE:
        return translated("There is no room left on this device. Make room and try again.");
    case PELLIKO_SHARES_ERROR_BUSY:
        return translated("This file is just being saved by another program.");
    case PELLIKO_ERROR_SERVICE_NOT_RUNNING:
    case PELLIKO_ERROR_SERVICE_INITIALIZING:
        return translated("The sharing service does not answer. Try again.");
    default:
        return translated("The folder for downloads cannot be written.");
    }
}

companion::RowTexts rowOf(const companion::ShareFile &file, const FileState &state)
{
    return {file.name, companion::sizeText(file.size), stateOf(file, state)};
}

std::string outcomeText(const Saving &saving)
{
    if (saving.running() || saving.roundCount() == 0)
        return {};
    std::string text = faultText(saving.fault());
    if (saving.roundSaved() == 0)
        return text;
    if (!text.empty())
        text += " ";
    text += counted("%d file was saved.", "%d files were saved.", saving.roundSaved());
    return text;
}

} // namespace pelliko::viewer

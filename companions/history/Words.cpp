#include "Words.h"

#include <Formats.h>
#include <Language.h>

namespace pelliko::history
{

using companion::counted;
using companion::filledIn;
using companion::translated;

namespace
{

// The codes that tell of the server or the way to it; all others are faults of this device.
bool isServerFault(int error)
{
    return error == -16 || error == -7 || error == PELLIKO_ERROR_SERVICE_NOT_RUNNING;
}

std::string endText(const companion::Share &share)
{
    if (share.state == PELLIKO_SHARE_WITHDRAWN)
        return translated("Withdrawn");
    if (share.state == PELLIKO_SHARE_EXPIRED)
        return share.expires > 0 ? filledIn("Expired on %s", dateOf(share.expires))
                                 : translated("Expired");
    return share.expires > 0 ? filledIn("Available until %s", dateOf(share.expires))
                             : translated("Available");
}

companion::RowTexts row(std::string title, const companion::Share &share, std::string state,
                        bool isNew)
{
    if (isNew)
        state = filledIn("New: %s", state);
    return {std::move(title), contentText(share), std::move(state)};
}

} // namespace

std::string dateOf(int64_t seconds)
{
    // Translators give the order of day, month and year that their readers expect.
    return companion::dateText(seconds, translated("%Y-%m-%d %H:%M"));
}

std::string contentText(const companion::Share &share)
{
    return counted("%d file", "%d files", share.files.size()) + ", " +
           companion::sizeText(share.size);
}

std::string recipientsText(const companion::SentShare &share)
{
    constexpr size_t mostNames = 3;
    std::string names;
    for (size_t i = 0; i < share.recipients.size() && i < mostNames; ++i)
        names += (i == 0 ? "" : ", ") + share.recipients[i].name;
    if (share.recipients.size() > mostNames)
        names += " " + counted("and %d more", "and %d more", share.recipients.size() - mostNames);
    return names.empty() ? translated("Nobody") : names;
}

std::string senderText(const companion::ReceivedShare &share)
{
    return share.sender.empty() ? translated("Unknown sender") : share.sender;
}

std::string stateText(const companion::SentShare &share)
{
    switch (share.state) {
    case PELLIKO_SHARE_UPLOADING:
        return filledIn("Sending, %s", std::to_string(share.percent) + " %");
    case PELLIKO_SHARE_PAUSED:
        return translated("Paused: waits for a connection");
    case PELLIKO_SHARE_NOTIFYING:
        return translated("Telling the recipients");
    case PELLIKO_SHARE_WITHDRAWING:
        return translated("Being withdrawn, as soon as the server can be reached");
    case PELLIKO_SHARE_CANCELLED:
        return translated("Cancelled");
    case PELLIKO_SHARE_FAILED:
        return isServerFault(share.error) ? translated("Failed: the server had an error")
                                          : translated("Failed: this device had an error");
    default:
        return endText(share);
    }
}

std::string stateText(const companion::ReceivedShare &share)
{
    return endText(share);
}

std::string toldText(const companion::Recipient &recipient)
{
    switch (recipient.told) {
    case PELLIKO_TOLD_PUSH:
        return translated("Sees it in Pelliko");
    case PELLIKO_TOLD_SMS:
        return translated("Gets an SMS with the link");
    case PELLIKO_TOLD_NOBODY:
        return translated("Gets nothing: this is no phone number");
    default:
        return translated("Not told yet");
    }
}

companion::RowTexts rowOf(const companion::SentShare &share, bool isNew)
{
    return row(recipientsText(share), share, stateText(share), isNew);
}

companion::RowTexts rowOf(const companion::ReceivedShare &share, bool isNew)
{
    return row(senderText(share), share, stateText(share), isNew);
}

std::string faultText(int code)
{
    switch (code) {
    case PELLIKO_SHARES_ERROR_NOT_FOUND:
        return translated("This share is not there any more.");
    case PELLIKO_SHARES_ERROR_EXPIRED:
        return translated("The time of this share is over.");
    case PELLIKO_SHARES_ERROR_WITHDRAWN:
        return translated("This share was withdrawn.");
    case PELLIKO_SHARES_ERROR_UNREACHABLE:
        return translated("The share server cannot be reached. Try again later.");
    case PELLIKO_SHARES_ERROR_REFUSED:
        return translated("This is not possible now.");
    case PELLIKO_ERROR_SERVICE_NOT_RUNNING:
    case PELLIKO_ERROR_SERVICE_INITIALIZING:
        return translated("The sharing service does not answer. Try again.");
    default:
        return translated("This device had an error. Make room on it and try again.");
    }
}

} // namespace pelliko::history

#include "PellikoUploadingDataManager/StatusRecipients.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/RecipientsRow.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <string>
#include <vector>

namespace pelliko
{

namespace
{

constexpr std::string_view smsMark = "+SMS";

// The mark becomes the badge: it is no part of the name that is shown.
std::string _name(const std::string &recipient)
{
    return _checkSmsReceiver(recipient) ? recipient.substr(0, recipient.size() - smsMark.size())
                                        : recipient;
}

} // namespace

bool _checkSmsReceiver(std::string_view recipient)
{
    return recipient.ends_with(smsMark);
}

void addRecipientsData(PellikoAppData *ad)
{
    if (!ad || !ad->popup_layout)
        return;
    const std::vector<std::string> &recipients = g_noti_press_data.recipients;
    const std::vector<std::string> &pictures = g_noti_press_data.pictures;
    LOG_DEBUG("TOTAL RECEPIENTS:[%d]", static_cast<int>(recipients.size()));
    std::vector<std::string> names;
    for (const std::string &recipient : recipients) {
        LOG_DEBUG("recipient = %s", recipient.c_str());
        names.push_back(_name(recipient));
    }
    std::vector<RowPerson> people;
    for (size_t i = 0; i < recipients.size(); ++i)
        people.push_back({names[i].c_str(), i < pictures.size() ? pictures[i].c_str() : nullptr,
                          _checkSmsReceiver(recipients[i])});
    putRecipientsRow(ad, people, RowCells::equal);
}

} // namespace pelliko

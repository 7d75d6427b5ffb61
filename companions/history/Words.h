// How shares are told to the user.
#pragma once

#include <KeptShares.h>
#include <RowTexts.h>

namespace pelliko::history
{

/// "3 files, 2.4 MB".
std::string contentText(const companion::Share &share);

/// Whom it was sent to: the first three by name, and how many more.
std::string recipientsText(const companion::SentShare &share);
/// The sender's name or number, or words for nobody known.
std::string senderText(const companion::ReceivedShare &share);

/// How it stands, with its end date where it has one.
std::string stateText(const companion::SentShare &share);
std::string stateText(const companion::ReceivedShare &share);

/// How a recipient learns of the share.
std::string toldText(const companion::Recipient &recipient);

/// The row of a share in its list.
/// @param isNew it arrived or ended while the list was open
companion::RowTexts rowOf(const companion::SentShare &share, bool isNew);
companion::RowTexts rowOf(const companion::ReceivedShare &share, bool isNew);

/// Why something could not be done, and what to do about it.
/// @param code of pelliko_shares.h
std::string faultText(int code);

/// A date in the user's form.
std::string dateOf(int64_t seconds);

} // namespace pelliko::history

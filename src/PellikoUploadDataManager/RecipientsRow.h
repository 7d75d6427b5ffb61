// The row of recipients in a popup. Main loop only.
#pragma once

#include <Evas.h>
#include <vector>

namespace pelliko
{

class PellikoAppData;

/// One person of the row; the texts are borrowed and may be null.
struct RowPerson {
    const char *name;
    const char *image_path; ///< none, or one that cannot be read: the default picture
    bool by_sms;            ///< with the SMS badge
};

/// A person's share of the row's width.
enum class RowCells { by_name, equal };

/// Builds a row (round pictures with names, SMS badges) and puts it into `ad->popup_layout`, whose
/// earlier row is deleted.
void putRecipientsRow(PellikoAppData *ad, const std::vector<RowPerson> &people, RowCells cells);

/// The row of the recipients of the share in hand; nothing without one.
void addRecipientsFromUploadData(PellikoAppData *ad);

} // namespace pelliko

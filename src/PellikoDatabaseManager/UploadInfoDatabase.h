#pragma once

#include "PellikoUploadDataManager/UploadNotiData.h"

#include <cstdint>

// One row per upload that the service accepted and that has not ended, kept so that the pending
// uploads can be rebuilt after a restart. Failures are logged only. Main loop only.

namespace pelliko
{

/// Creates the table when it is missing; true on success.
bool createTableUploadInfoDb();

/// Inserts one row made from the node.
void writeUploadDataToDb(const UploadNotiData *node);

/// Appends one node to the pending list for every row; false when the table cannot be read.
bool readUploadDataFromDb();

/// Deletes the row of that request id; a missing row is no error.
void deleteUploadDataFromDb(int32_t request_id);

/// Removes the file with all rows. Nothing else of this process may follow: what is written later
/// is lost with the file, whose handle stays open.
void deleteUploadInfoDb();

} // namespace pelliko

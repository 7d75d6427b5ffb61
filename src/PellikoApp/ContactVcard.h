// Contacts that are shared: written to a vCard file away from the loop, then shared as that file.
#pragma once

#include "PellikoApp/AppData.h"

namespace pelliko
{

/// What the exporting worker and the platform's helper work on.
struct VcardJob {
    PellikoAppData *ad = nullptr;
    app_control_h app_control = nullptr; ///< the launch request as it came, kept by the loop
    char **id_list = nullptr;            ///< contact ids, each from malloc
    int id_count = 0;
    int share_mode = 0;    ///< 0: all contacts in one file, 1: one file for each
    int is_my_profile = 0; ///< 1: the user's own card
};

/// Exports the contacts that ad->app_control names and goes on with the share of the file when that
/// is done. Requests that come meanwhile wait for their turn, for they all write ad->vcf_path. Main
/// loop only.
void startContactVcard(PellikoAppData *ad);

/// The worker: reads the request and has its contacts written; 0, or -1 when there is no memory for
/// it. The request belongs to the worker meanwhile. The outcome is ad->vcf_path.
int _createVcf(app_control_h request, PellikoAppData *ad);

/// Takes the name of a file that was written into ad->vcf_path; always true, so that the export
/// goes on. `job` is a VcardJob. Worker.
bool _makeVcardContactCb(const char *file_name, int progress_count, void *job);

/// The worker has ended: shares the file, unless there is none or the user has left. Main loop
/// only.
void _createVcfThreadEnd();

/// Shows that something goes on, in `ad->processing_popup`; needs `ad->win`. The back key closes it
/// and drops the share. Main loop only.
void _showProcessingPopup(PellikoAppData *ad);

} // namespace pelliko

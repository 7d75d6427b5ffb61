#pragma once

#include <cstdint>
#include <velmora_log_manager.h>

// Usage statistics: which features are used, in buckets, without names, numbers or paths.

namespace pelliko
{

class PellikoAppData;

/// Sends usage records to the platform's usage log. Nothing waits for a record or depends on it: a
/// log that cannot be written is only traced. Any thread.
class PellikoVelmoraLog
{
public:
    /// The instance, never null, made at the first call. While it has no connection to the log each
    /// call tries again to make one.
    static PellikoVelmoraLog *getInstance();

    virtual ~PellikoVelmoraLog();
    PellikoVelmoraLog(const PellikoVelmoraLog &) = delete;
    PellikoVelmoraLog &operator=(const PellikoVelmoraLog &) = delete;

    /// A share or reshare that the upload service has accepted.
    /// @param content_types rows of the extension table, one per file; an element may be null
    /// @param wifi_only nonzero: over Wi-Fi only
    /// @param file_size bytes of all files
    void insertVelmoraLogShareVia(const PellikoAppData *ad, int recipient_count,
                                  const char *const *content_types, int content_types_length,
                                  uint8_t wifi_only, int file_count, uint32_t file_size);

    /// A share that was refused. `reason`: 0 too large, 1 too much in one day, 2 no supported file,
    /// 3 too many files.
    void insertVelmoraLogShareReject(int reason);

    /// The user took a share back.
    void insertVelmoraLogShareCancel();

    /// The SMS of a share were handed to the messaging service.
    void insertVelmoraLogSendSms();

    /// Somebody's share was announced to this user.
    void insertVelmoraLogReceiveNotification();

private:
    /// Sets `connecting`: the call that made the instance has tried already.
    explicit PellikoVelmoraLog(bool &connecting);
    void connect();
    velmora_log_manager_h handle() const;

    velmora_log_manager_h handle_ = nullptr;
};

/// Position of the extension in the table of supported extensions, 80 when no row matches. A match
/// is logged. Null matches nothing.
int _getFileTypeNumFromFileExtension(const char *extension);

} // namespace pelliko

// The numbers of the device's contacts store, read and marked on a thread
#pragma once

#include "ContactMarks.h"

#include <gio/gio.h>

#include <array>
#include <memory>

namespace pelliko::service
{

/** The device's contacts store. Long work is done on a thread; a change by others is noticed. */
class StoreMarks : public ContactMarks
{
public:
    /** @param changed called when somebody else has written the store */
    explicit StoreMarks(std::function<void()> changed);
    ~StoreMarks() override;
    StoreMarks(const StoreMarks &) = delete;
    StoreMarks &operator=(const StoreMarks &) = delete;

    void read(const std::string &ownNumber,
              std::function<void(bool, const std::vector<ContactNumber> &)> done) override;
    void write(const std::vector<MarkChange> &changes, std::function<void(bool)> done) override;

    /** Times and sizes of the store's files: the same as long as nobody has written it. */
    using Print = std::array<int64_t, 4>;

private:
    void onThread(std::function<std::function<void()>()> work);
    static void onChange(GFileMonitor *, GFile *, GFile *, GFileMonitorEvent, gpointer self);

    std::function<void()> changed_;
    GFileMonitor *monitor_ = nullptr;
    Print seen_{};
    std::shared_ptr<StoreMarks *> self_;
};

} // namespace pelliko::service

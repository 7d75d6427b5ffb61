#include "PellikoApp/SmsSender.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "support/AppWorld.h"

#include <app_preference.h>
#include <cstdlib>
#include <filesystem>
#include <new>

namespace
{
thread_local bool nextFails = false;
} // namespace

// One allocation of this thread may fail: the next one.
void *operator new(std::size_t size)
{
    void *memory = nextFails ? nullptr : malloc(size ? size : 1);
    nextFails = false;
    if (!memory)
        throw std::bad_alloc();
    return memory;
}
void operator delete(void *memory) noexcept
{
    free(memory);
}
void operator delete(void *memory, std::size_t) noexcept
{
    free(memory);
}

namespace pelliko::test
{
namespace
{

class SmsSenderWithoutMemory : public AppWorld
{
};

// The first thing that sending takes memory for is the handle of the messaging service.
TEST_F(SmsSenderWithoutMemory, MessagesThatCannotBeginAreDoneAllTheSame)
{
    SmsJob job;
    job.from_msisdn = "+447700900100";
    job.to_msisdn_list = {"+4479001"};
    job.url = "http://host/s/abc";
    job.file_count = 1;
    job.expired_time = "1777982400";
    job.text_format = "%s %s";
    preference_set_int(shareSmsDoneKey, 0);
    log.restart();
    nextFails = true;
    runSmsJob(job);
    EXPECT_EQ(log.text(), "msg_open_msg_handle Failed\n"
                          "Updating preference for sms_done with value = 1\n");
    EXPECT_FALSE(std::filesystem::exists(getenv("PELLIKO_SMS_OUTBOX")));
    int done = 0;
    ASSERT_EQ(preference_get_int(shareSmsDoneKey, &done), PREFERENCE_ERROR_NONE);
    EXPECT_EQ(done, 1);
}

} // namespace
} // namespace pelliko::test

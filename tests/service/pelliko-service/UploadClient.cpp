// A client that a test can kill: asks for an upload, or takes requests over, and prints what it is
// told.
//
//   upload-client request FILE      prints "id N", then one line per report: STATUS ERROR
//   upload-client resume ID         prints "result N", then one line per report

#include "pelliko_client.h"

#include <glib.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace
{
void onReport(int status, const char *, int, int64_t, int, int error, int, void *)
{
    std::printf("%d %d\n", status, error);
    std::fflush(stdout);
}

int request(char *file)
{
    char number[] = "+447700900111";
    pelliko_recipient_s recipient{nullptr, number, 11, 0};
    pelliko_recipient_s *recipients[] = {&recipient};
    const pelliko_upload_options_s options{1, 0};
    int32_t id = 0;
    const int result =
        pelliko_request_upload(&options, recipients, 1, &file, 1, 0, onReport, nullptr, &id);
    std::printf("id %d\n", id);
    return result;
}
} // namespace

int main(int argc, char **argv)
{
    if (argc != 3) {
        std::fprintf(stderr, "upload-client request FILE | resume ID\n");
        return 2;
    }
    if (std::strcmp(argv[1], "request") == 0) {
        if (request(argv[2]) != 0) {
            return 1;
        }
    } else {
        const auto id = static_cast<int32_t>(std::strtol(argv[2], nullptr, 10));
        std::printf("result %d\n", pelliko_resume_upload_by_reboot(id, onReport, nullptr));
    }
    std::fflush(stdout);
    g_main_loop_run(g_main_loop_new(nullptr, FALSE));
    return 0;
}

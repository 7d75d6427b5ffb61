#include "tizen_error.h"

#include <array>
#include <cstdlib>
#include <cstring>

namespace
{

struct Message {
    int code;
    const char *text;
};

// Codes of modules are named here as numbers: this room lies under theirs.
constexpr std::array kMessages{
    Message{TIZEN_ERROR_NONE, "Successful"},
    Message{TIZEN_ERROR_TIMED_OUT, "Time out"},
    Message{TIZEN_ERROR_NOT_SUPPORTED, "Not supported"},
    Message{TIZEN_ERROR_KEY_NOT_AVAILABLE, "Required key not available"},
    Message{TIZEN_ERROR_KEY_REJECTED, "Key was rejected by service"},
    Message{TIZEN_ERROR_APPLICATION | 0x21, "Application not found"},
    Message{TIZEN_ERROR_APPLICATION | 0x22, "Invalid data type"},
    Message{TIZEN_ERROR_APPLICATION | 0x23, "Launch rejected"},
    Message{TIZEN_ERROR_APPLICATION | 0x24, "Launch failed"},
    Message{TIZEN_ERROR_APPLICATION | 0x30, "No such key"},
    Message{TIZEN_ERROR_BUNDLE | 0x01, "Key exists"},
};

constexpr int kLargestErrno = 4095;

thread_local int lastResult = TIZEN_ERROR_NONE;

const char *messageOf(int code)
{
    for (const Message &message : kMessages) {
        if (message.code == code)
            return message.text;
    }
    if (code < 0 && code >= -kLargestErrno) {
        // The description is static text, unlike that of strerror, so any thread may keep it.
        if (const char *text = strerrordesc_np(-code))
            return text;
    }
    return "Unknown error";
}

} // namespace

char *get_error_message(int err_code)
{
    return const_cast<char *>(messageOf(err_code));
}

int get_last_result(void)
{
    return lastResult;
}

void set_last_result(int err_code)
{
    lastResult = err_code;
}

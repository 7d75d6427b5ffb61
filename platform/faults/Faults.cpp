#include "Faults.h"
#include "Verdict.h"

#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <map>
#include <mutex>
#include <string_view>
#include <unistd.h>

using pelliko::platform::planFaults;
using pelliko::platform::traceCalls;

bool pelliko_faults_asked_for = false;

// What the linker collected: the names of the calls that this program makes.
extern "C" {
extern const char *const __start_pelliko_fault_calls[] __attribute__((weak, visibility("hidden")));
extern const char *const __stop_pelliko_fault_calls[] __attribute__((weak, visibility("hidden")));
}

namespace
{

struct Fault {
    bool has_result = false;
    long result = 0;
};

using Plan = std::map<std::string, std::map<int, Fault>, std::less<>>;

struct State {
    std::mutex mutex;
    Plan plan;
    std::map<std::string, int, std::less<>> made;
    int trace = -1;
};

// Never destroyed: a detached thread may call until the very end of the process.
State &state()
{
    static auto *const state = new State;
    return *state;
}

// Negative numbers of the interfaces' own error lists: these rooms lie above this one.
struct Usual {
    const char *beginning;
    long result;
};

constexpr long ioError = -5;
constexpr long outOfMemory = -12;

constexpr Usual usualResults[] = {
    {"aul_", 0},
    {"contacts_", -0x02010000 | 0x9F},
    {"contacts_service_helper_", -1},
    {"kor_", -1},
    {"msg_", -5},
    {"notification_", -0x01140000 | 0x01},
    {"pelliko_", -4},
    {"tel_", -1},
    {"vconf_", -1},
    {"app_control_create", outOfMemory},
    {"app_control_get_", -126},
    {"bundle_", outOfMemory},
    {"open64", -1},
    {"remove", -1},
    {"rename", -1},
    {"stat64", -1},
    {"system", -1},
    {"truncate64", -1},
    {"vasprintf", -1},
    {"write", -1},
    {"pthread_", EAGAIN},
    {"sqlite3_", 10}, // SQLITE_IOERR
    {"ecore_file_size", 0},
};

// The longest beginning that fits decides.
long usualResult(std::string_view call, int kind)
{
    if (kind != PELLIKO_FAULT_NUMBER)
        return 0;
    long result = ioError;
    size_t fitting = 0;
    for (const Usual &usual : usualResults) {
        const size_t length = strlen(usual.beginning);
        if (length > fitting && call.starts_with(usual.beginning)) {
            fitting = length;
            result = usual.result;
        }
    }
    return result;
}

bool isCall(std::string_view name)
{
    for (const char *const *call = __start_pelliko_fault_calls; call != __stop_pelliko_fault_calls;
         ++call) {
        if (name == *call)
            return true;
    }
    return false;
}

template <typename Number> bool readNumber(std::string_view text, Number &number)
{
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size();
}

std::string addFault(std::string_view text, Plan &plan)
{
    const size_t colon = text.find(':'), equals = text.find('=');
    const std::string name(text.substr(0, colon));
    if (!isCall(name))
        return "this program makes no call \"" + name + "\"";
    int turn = 0;
    Fault fault;
    fault.has_result = equals != std::string_view::npos;
    if (colon == std::string_view::npos || (fault.has_result && equals < colon) ||
        !readNumber(text.substr(colon + 1, equals - colon - 1), turn) || turn < 1 ||
        (fault.has_result && !readNumber(text.substr(equals + 1), fault.result)))
        return "\"" + std::string(text) + "\" is not like CALL:N or CALL:N=RESULT";
    plan[name][turn] = fault;
    return "";
}

void note(const State &state, const char *call, int turn, bool fails)
{
    if (state.trace < 0)
        return;
    char line[128];
    const int length =
        snprintf(line, sizeof(line), "%s %d%s\n", call, turn, fails ? " failed" : "");
    if (write(state.trace, line, static_cast<size_t>(length)) != length)
        perror("fault trace");
}

void endOnComplaint(const char *variable, const std::string &complaint)
{
    if (complaint.empty())
        return;
    fprintf(stderr, "%s: %s\n", variable, complaint.c_str());
    _exit(2);
}

// Before anything else of the program runs, as that may make calls already.
__attribute__((constructor(101))) void readEnvironment()
{
    if (const char *plan = getenv("PELLIKO_FAULTS"))
        endOnComplaint("PELLIKO_FAULTS", planFaults(plan));
    if (const char *file = getenv("PELLIKO_FAULTS_TRACE"))
        endOnComplaint("PELLIKO_FAULTS_TRACE", traceCalls(file));
}

} // namespace

PellikoVerdict pelliko_fault_verdict(const char *call, int kind)
{
    const int error = errno;
    State &all = state();
    const std::lock_guard lock(all.mutex);
    const int turn = ++all.made[call];
    const auto planned = all.plan.find(std::string_view(call));
    const bool fails = planned != all.plan.end() && planned->second.contains(turn);
    note(all, call, turn, fails);
    errno = fails ? EIO : error;
    if (!fails)
        return {0, 0};
    const Fault &fault = planned->second[turn];
    return {1, fault.has_result ? fault.result : usualResult(call, kind)};
}

namespace pelliko::platform
{

std::string planFaults(const std::string &plan)
{
    Plan wanted;
    std::string_view rest = plan;
    while (!rest.empty()) {
        const size_t comma = rest.find(',');
        if (std::string complaint = addFault(rest.substr(0, comma), wanted); !complaint.empty())
            return complaint;
        rest = comma == std::string_view::npos ? "" : rest.substr(comma + 1);
    }
    State &all = state();
    const std::lock_guard lock(all.mutex);
    all.plan = std::move(wanted);
    all.made.clear();
    pelliko_faults_asked_for = !all.plan.empty() || all.trace >= 0;
    return "";
}

std::string traceCalls(const std::string &file)
{
    int opened = -1;
    if (!file.empty()) {
        opened = open(file.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
        if (opened < 0)
            return "cannot write " + file + ": " + strerror(errno);
    }
    State &all = state();
    const std::lock_guard lock(all.mutex);
    if (all.trace >= 0)
        close(all.trace);
    all.trace = opened;
    pelliko_faults_asked_for = !all.plan.empty() || all.trace >= 0;
    return "";
}

} // namespace pelliko::platform

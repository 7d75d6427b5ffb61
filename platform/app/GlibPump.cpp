#include "GlibPump.h"

#include <Ecore.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <glib.h>
#include <poll.h>
#include <sys/select.h>
#include <vector>

namespace pelliko::platform
{

namespace
{

// The bits of a descriptor set and the poll events that mean the same.
struct Interest {
    fd_set *set;
    short wanted;
    short happened;
};
using Interests = std::array<Interest, 3>;

using Descriptors = std::vector<GPollFD>;

void appendEcore(Descriptors &fds, int count, const Interests &interests)
{
    for (int fd = 0; fd < count; ++fd) {
        unsigned events = 0;
        for (const Interest &interest : interests) {
            if (interest.set && FD_ISSET(fd, interest.set))
                events |= static_cast<unsigned>(interest.wanted);
        }
        if (events != 0)
            fds.push_back({fd, static_cast<gushort>(events), 0});
    }
}

int millisecondsOf(const timeval *timeout)
{
    // Rounded up: a timer that is due in less than a millisecond must not make the loop spin.
    return timeout ? static_cast<int>(timeout->tv_sec * 1000 + (timeout->tv_usec + 999) / 1000)
                   : -1;
}

int shorter(int a, int b)
{
    if (a < 0 || b < 0)
        return std::max(a, b);
    return std::min(a, b);
}

// Writes what happened to Ecore's descriptors, the ones from `first` on; returns select's count.
int reportEcore(const Descriptors &fds, std::size_t first, const Interests &interests)
{
    int count = 0;
    for (const Interest &interest : interests) {
        if (interest.set)
            FD_ZERO(interest.set);
    }
    for (std::size_t i = first; i < fds.size(); ++i) {
        for (const Interest &interest : interests) {
            if (interest.set && (fds[i].events & interest.wanted) != 0 &&
                (fds[i].revents & interest.happened) != 0) {
                FD_SET(fds[i].fd, interest.set);
                ++count;
            }
        }
    }
    return count;
}

// GLib's own descriptors that are to be watched; also says how long it is willing to wait.
Descriptors queryGlib(GMainContext *context, int priority, int *timeout)
{
    Descriptors fds(16);
    int needed =
        g_main_context_query(context, priority, timeout, fds.data(), static_cast<int>(fds.size()));
    while (static_cast<std::size_t>(needed) > fds.size()) {
        fds.resize(static_cast<std::size_t>(needed));
        needed = g_main_context_query(context, priority, timeout, fds.data(),
                                      static_cast<int>(fds.size()));
    }
    fds.resize(static_cast<std::size_t>(needed));
    return fds;
}

static_assert(sizeof(GPollFD) == sizeof(pollfd), "GLib's descriptors are those of poll()");

int waitForBoth(int count, fd_set *readable, fd_set *writable, fd_set *exceptional,
                timeval *timeout)
{
    const Interests interests{{{readable, POLLIN, POLLIN | POLLHUP | POLLERR},
                               {writable, POLLOUT, POLLOUT | POLLERR},
                               {exceptional, POLLPRI, POLLPRI}}};
    GMainContext *context = g_main_context_default();
    if (!g_main_context_acquire(context))
        return select(count, readable, writable, exceptional, timeout);
    int priority = 0;
    int glibTimeout = -1;
    g_main_context_prepare(context, &priority);
    Descriptors fds = queryGlib(context, priority, &glibTimeout);
    const std::size_t glibCount = fds.size();
    appendEcore(fds, count, interests);
    const int polled = poll(reinterpret_cast<pollfd *>(fds.data()), fds.size(),
                            shorter(millisecondsOf(timeout), glibTimeout));
    const int pollError = errno;
    if (polled < 0)
        std::for_each(fds.begin(), fds.end(), [](GPollFD &fd) { fd.revents = 0; });
    // Ecore's sets are filled before GLib's callbacks run, which may wait in a loop of their own.
    const int ready = reportEcore(fds, glibCount, interests);
    if (g_main_context_check(context, priority, fds.data(), static_cast<int>(glibCount)))
        g_main_context_dispatch(context);
    g_main_context_release(context);
    errno = pollError;
    return polled < 0 ? -1 : ready;
}

} // namespace

void installGlibPump()
{
    ecore_main_loop_select_func_set(waitForBoth);
}

void removeGlibPump()
{
    ecore_main_loop_select_func_set(select);
}

} // namespace pelliko::platform

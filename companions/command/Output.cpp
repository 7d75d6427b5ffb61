#include "Output.h"

#include <glib.h>

#include <algorithm>
#include <cstdio>
#include <unistd.h>

namespace pelliko::command
{

Exit refuse(Exit status, const std::string &sentence)
{
    std::fprintf(stderr, "pelliko: %s\n", sentence.c_str());
    return status;
}

Exit finish()
{
    if (std::fflush(stdout) == 0 && std::ferror(stdout) == 0)
        return Exit::done;
    return refuse(Exit::failed, "the output cannot be written");
}

bool forPeople()
{
    return isatty(STDOUT_FILENO) == 1;
}

int columnsOf(const std::string &text)
{
    int columns = 0;
    for (const char *at = text.c_str(); *at; at = g_utf8_next_char(at)) {
        const gunichar character = g_utf8_get_char(at);
        if (g_unichar_iszerowidth(character) == FALSE)
            columns += g_unichar_iswide(character) != FALSE ? 2 : 1;
    }
    return columns;
}

std::string padded(const std::string &text, int columns)
{
    const int missing = std::max(0, columns - columnsOf(text));
    return text + std::string(static_cast<std::size_t>(missing), ' ');
}

std::string printable(const std::string &text)
{
    g_autofree char *valid = g_utf8_make_valid(text.c_str(), -1);
    std::string shown;
    for (const char *at = valid; *at; at = g_utf8_next_char(at)) {
        if (g_unichar_iscntrl(g_utf8_get_char(at)) != FALSE)
            shown += '?';
        else
            shown.append(at, static_cast<const char *>(g_utf8_next_char(at)));
    }
    return shown;
}

} // namespace pelliko::command

#include "Process.h"

#include <gio/gunixinputstream.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <iostream>

namespace
{
std::vector<const char *> pointers(const std::vector<std::string> &words)
{
    std::vector<const char *> result;
    for (const std::string &word : words) {
        result.push_back(word.c_str());
    }
    result.push_back(nullptr);
    return result;
}

[[noreturn]] void die(const std::string &text)
{
    std::cerr << text << std::endl;
    std::abort();
}
} // namespace

bool runUntil(const std::function<bool()> &condition, int seconds)
{
    bool late = false;
    const guint timer = g_timeout_add_seconds(
        static_cast<guint>(seconds),
        [](gpointer flag) -> gboolean {
            *static_cast<bool *>(flag) = true;
            return G_SOURCE_CONTINUE;
        },
        &late);
    while (!condition() && !late) {
        g_main_context_iteration(nullptr, TRUE);
    }
    g_source_remove(timer);
    return condition();
}

Process::Process(const std::vector<std::string> &words, bool readyFd) : stop_(g_cancellable_new())
{
    g_autoptr(GSubprocessLauncher) launcher = g_subprocess_launcher_new(
        readyFd ? G_SUBPROCESS_FLAGS_NONE : G_SUBPROCESS_FLAGS_STDOUT_PIPE);
    int ends[2] = {-1, -1};
    if (readyFd) {
        if (pipe(ends) != 0) {
            die("no pipe");
        }
        g_subprocess_launcher_take_fd(launcher, ends[1], 3);
    }
    g_autoptr(GError) error = nullptr;
    process_ = g_subprocess_launcher_spawnv(launcher, pointers(words).data(), &error);
    if (!process_) {
        die(words[0] + ": " + error->message);
    }
    g_subprocess_launcher_close(launcher);
    GInputStream *stream =
        readyFd ? g_unix_input_stream_new(ends[0], TRUE)
                : G_INPUT_STREAM(g_object_ref(g_subprocess_get_stdout_pipe(process_)));
    output_ = g_data_input_stream_new(stream);
    g_object_unref(stream);
    g_data_input_stream_read_line_async(output_, G_PRIORITY_DEFAULT, stop_, onLine, this);
    g_subprocess_wait_async(process_, stop_, onEnded, this);
}

Process::~Process()
{
    end(SIGKILL);
    g_cancellable_cancel(stop_);
    // The cancelled reads still come back once, and must find nothing to do.
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    g_object_unref(output_);
    g_object_unref(stop_);
    g_object_unref(process_);
}

void Process::onLine(GObject *stream, GAsyncResult *result, gpointer data)
{
    g_autoptr(GError) error = nullptr;
    g_autofree char *line =
        g_data_input_stream_read_line_finish(G_DATA_INPUT_STREAM(stream), result, nullptr, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED) || !line) {
        return;
    }
    auto &self = *static_cast<Process *>(data);
    self.lines_.emplace_back(line);
    g_data_input_stream_read_line_async(self.output_, G_PRIORITY_DEFAULT, self.stop_, onLine, data);
}

void Process::onEnded(GObject *process, GAsyncResult *result, gpointer data)
{
    g_autoptr(GError) error = nullptr;
    g_subprocess_wait_finish(G_SUBPROCESS(process), result, &error);
    if (!g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED)) {
        static_cast<Process *>(data)->ended_ = true;
    }
}

void Process::signal(int number)
{
    g_subprocess_send_signal(process_, number);
}

void Process::end(int number)
{
    if (!ended_) {
        signal(number);
        runUntil([this] { return ended_; });
    }
}

std::string outputOf(const std::vector<std::string> &words, const std::string &input)
{
    g_autoptr(GError) error = nullptr;
    const auto flags = static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDIN_PIPE |
                                                     G_SUBPROCESS_FLAGS_STDOUT_PIPE);
    g_autoptr(GSubprocess) process = g_subprocess_newv(pointers(words).data(), flags, &error);
    g_autofree char *output = nullptr;
    if (!process ||
        !g_subprocess_communicate_utf8(process, input.c_str(), nullptr, &output, nullptr, &error)) {
        die(words[0] + ": " + error->message);
    }
    if (!g_subprocess_get_successful(process)) {
        die(words[0] + " failed");
    }
    std::string text = output;
    while (!text.empty() && text.back() == '\n') {
        text.pop_back();
    }
    return text;
}

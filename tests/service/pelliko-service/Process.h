#pragma once

#include <gio/gio.h>

#include <functional>
#include <string>
#include <vector>

/** Runs the main loop until the condition holds; false when it did not within that time. */
bool runUntil(const std::function<bool()> &condition, int seconds = 20);

/** A program that a test runs; it is killed with the object. Its lines are gathered as they come.
 */
class Process
{
public:
    /** @param readyFd gives the program the descriptor 3, whose lines are gathered in place of its
     * output */
    explicit Process(const std::vector<std::string> &words, bool readyFd = false);
    ~Process();
    Process(const Process &) = delete;
    Process &operator=(const Process &) = delete;

    const std::vector<std::string> &lines() const { return lines_; }
    bool running() const { return !ended_; }
    void signal(int number);
    /** Ends it with that signal and waits until it is gone. */
    void end(int number);

private:
    static void onLine(GObject *stream, GAsyncResult *result, gpointer self);
    static void onEnded(GObject *process, GAsyncResult *result, gpointer self);

    GSubprocess *process_;
    GDataInputStream *output_;
    GCancellable *stop_;
    std::vector<std::string> lines_;
    bool ended_ = false;
};

/** Runs a program to its end. @return its output without the last line end; a failure ends the test
 * program */
std::string outputOf(const std::vector<std::string> &words, const std::string &input = {});

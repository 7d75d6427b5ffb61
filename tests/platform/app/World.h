// What the tests of whole applications share: recorders that the bus can start, their diaries, and
// commands.
#pragma once

#include <gio/gio.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

namespace pelliko::test
{

struct Ended {
    int status;
    std::string out;
    std::string err;
};
using Environment = std::map<std::string, std::string>;

/// Runs a command to its end. `status` is the exit status, or -signal.
Ended run(const std::vector<std::string> &command, const Environment &environment = {});

/// The built program of that name.
std::string program(const std::string &name);
/// app-launch with these arguments.
Ended appLaunch(const std::vector<std::string> &arguments);

/// Runs the default main context until `done` is true; false after `seconds` without.
bool turnUntil(const std::function<bool()> &done, unsigned seconds = 20);

/// A recorder application with an id and a diary of its own.
class RecorderApp
{
public:
    /// `installed` writes an activation file, so that the bus can start it.
    explicit RecorderApp(const std::string &name, bool installed = true);

    const std::string &id() const { return id_; }
    /// What a recorder needs in its environment to be this application.
    Environment environment() const;
    /// Runs a recorder by hand to its end.
    Ended startByHand(const std::vector<std::string> &arguments = {}, Environment extra = {}) const;
    /// Starts one by hand and returns at once.
    GSubprocess *spawn() const;

    std::vector<std::string> diary() const;
    /// The diary, as soon as it has a line that begins with `start`.
    std::vector<std::string> diaryWith(const std::string &start) const;
    /// Waits until no process owns the application's name.
    bool waitUntilGone() const;

private:
    std::string id_;
    std::string folder_;
    std::string log_;
};

} // namespace pelliko::test

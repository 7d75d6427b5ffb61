#include "KeyWatch.h"

#include "KeyNode.h"

#include <StateDir.h>

#include <algorithm>
#include <array>
#include <climits>
#include <glib-unix.h>
#include <sys/inotify.h>
#include <unistd.h>

namespace pelliko::vconf
{

namespace
{

// A set is a rename onto the key's name; a person with an editor or a shell closes a written file.
constexpr unsigned kSets = IN_MOVED_TO | IN_CLOSE_WRITE;

std::string folderOf(const std::string &path)
{
    return path.substr(0, path.rfind('/'));
}

} // namespace

KeyWatch::KeyWatch() : inotify_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK))
{
    if (inotify_ < 0)
        return;
    const auto onReadable = [](gint, GIOCondition, gpointer self) -> gboolean {
        static_cast<KeyWatch *>(self)->readEvents();
        return G_SOURCE_CONTINUE;
    };
    source_ = g_unix_fd_add(inotify_, G_IO_IN, onReadable, this);
}

KeyWatch::~KeyWatch()
{
    if (inotify_ < 0)
        return;
    g_source_remove(source_);
    close(inotify_);
}

bool KeyWatch::watchFolderOf(const std::string &key)
{
    const std::string path = fileOfKey(key);
    if (path.empty() || !platform::createPrivateDirectories(folderOf(path)))
        return false;
    const int watch = inotify_add_watch(inotify_, folderOf(path).c_str(), kSets);
    if (watch < 0)
        return false;
    folders_[watch] = folderOf(key);
    return true;
}

KeyWatch::Listeners::iterator KeyWatch::find(const std::string &key, vconf_callback_fn callback)
{
    return std::find_if(listeners_.begin(), listeners_.end(), [&](const ListenerPtr &listener) {
        return listener->key == key && listener->callback == callback;
    });
}

bool KeyWatch::add(const std::string &key, vconf_callback_fn callback, void *userData)
{
    if (find(key, callback) != listeners_.end() || !watchFolderOf(key))
        return false;
    listeners_.push_back(std::make_shared<Listener>(Listener{key, callback, userData}));
    return true;
}

bool KeyWatch::remove(const std::string &key, vconf_callback_fn callback)
{
    const auto found = find(key, callback);
    if (found == listeners_.end())
        return false;
    listeners_.erase(found);
    return true;
}

void KeyWatch::keyWasSet(const std::string &key)
{
    const std::optional<Value> value = readKey(key);
    if (!value)
        return;
    keynode_t node{key, *value};
    // A callback may register and remove callbacks, its own included.
    const Listeners called = listeners_;
    for (const ListenerPtr &listener : called) {
        const bool known =
            std::find(listeners_.begin(), listeners_.end(), listener) != listeners_.end();
        if (known && listener->key == key)
            listener->callback(&node, listener->userData);
    }
}

// The kernel's queue was full: any watched key may have been set.
void KeyWatch::eventsWereLost()
{
    const Listeners called = listeners_;
    std::vector<std::string> keys;
    for (const ListenerPtr &listener : called) {
        if (std::find(keys.begin(), keys.end(), listener->key) == keys.end())
            keys.push_back(listener->key);
    }
    for (const std::string &key : keys)
        keyWasSet(key);
}

void KeyWatch::readEvents()
{
    alignas(inotify_event) std::array<char, 16 * (sizeof(inotify_event) + NAME_MAX + 1)> buffer;
    const ssize_t length = read(inotify_, buffer.data(), buffer.size());
    for (ssize_t at = 0; at < length;) {
        const auto *event = reinterpret_cast<const inotify_event *>(buffer.data() + at);
        at += static_cast<ssize_t>(sizeof(inotify_event) + event->len);
        const auto folder = folders_.find(event->wd);
        if ((event->mask & IN_Q_OVERFLOW) != 0)
            eventsWereLost();
        else if (folder != folders_.end() && event->len > 0 && event->name[0] != '.')
            keyWasSet(folder->second + "/" + event->name);
    }
}

} // namespace pelliko::vconf

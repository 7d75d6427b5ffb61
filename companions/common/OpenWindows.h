// The windows of a program that may have several.
#pragma once

#include <Ecore.h>
#include <app.h>

#include <cstdint>
#include <map>
#include <memory>
#include <utility>
#include <vector>

namespace pelliko::companion
{

/// Owns them, and ends the program with the last. A window asks to be closed in the middle of its
/// own calls, so it goes with the main loop's next turn. Main loop only.
template <class Window> class OpenWindows
{
public:
    OpenWindows() = default;
    ~OpenWindows() { clear(); }
    OpenWindows(const OpenWindows &) = delete;
    OpenWindows &operator=(const OpenWindows &) = delete;

    /// Adds what `make` returns: a window, given the function by which it is to close itself.
    template <class Make> void open(const Make &make)
    {
        const uint32_t key = ++last_;
        windows_.emplace(key, make([this, key] { closeLater(key); }));
    }

    /// The first that fits, or null.
    template <class Fits> Window *find(const Fits &fits) const
    {
        for (const auto &[key, window] : windows_)
            if (fits(*window))
                return window.get();
        return nullptr;
    }

    /// The one that was opened last, or null.
    Window *newest() const { return windows_.empty() ? nullptr : windows_.rbegin()->second.get(); }

    template <class Act> void forEach(const Act &act) const
    {
        for (const auto &[key, window] : windows_)
            act(*window);
    }

    /// Closes all without ending the program.
    void clear()
    {
        if (job_)
            ecore_job_del(std::exchange(job_, nullptr));
        closing_.clear();
        windows_.clear();
    }

private:
    void closeLater(uint32_t key)
    {
        closing_.push_back(key);
        if (!job_)
            job_ = ecore_job_add(onClose, this);
    }

    static void onClose(void *data)
    {
        auto *self = static_cast<OpenWindows *>(data);
        self->job_ = nullptr;
        for (const uint32_t key : self->closing_)
            self->windows_.erase(key);
        self->closing_.clear();
        if (self->windows_.empty())
            ui_app_exit();
    }

    std::map<uint32_t, std::unique_ptr<Window>> windows_;
    uint32_t last_ = 0;
    std::vector<uint32_t> closing_;
    Ecore_Job *job_ = nullptr;
};

} // namespace pelliko::companion

#pragma once

#include "http/Context.h"

#include <memory>

namespace pelliko::server
{

/// Makes what was written so far durable, and the blob whole when that is all of it, and then notes
/// the new offset. Refuses when the share ended meanwhile (gone), or another server has the upload
/// now (conflict).
Task<void> checkpoint(Context &context, std::shared_ptr<ActiveWrite> write);

/// The checkpoints of one append, made while more of its body arrives, one at a time. Network
/// thread only.
class Checkpoints
{
public:
    Checkpoints(Context &context, std::shared_ptr<ActiveWrite> write);

    /// A piece was written: begins a checkpoint when one is due and none runs. Waits for a running
    /// one only when much more has come meanwhile. Throws what ended one.
    Task<void> advance();

    /// Waits for the running one, if there is one, and throws what ended it.
    Task<void> finish();

private:
    struct Running;

    Task<void> note(std::shared_ptr<Running> running);

    Context &m_context;
    std::shared_ptr<ActiveWrite> m_write;
    std::shared_ptr<Running> m_running;
    std::uint64_t m_begunUpTo;
    std::uint64_t m_notedUpTo;
};

} // namespace pelliko::server

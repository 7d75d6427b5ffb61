#pragma once

#include "store/Metadata.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>

namespace pelliko::server
{

/// One implementation under test: a fresh, empty store, and a second look at the same data.
struct MetadataMaker {
    std::string name;
    std::function<std::unique_ptr<Metadata>()> fresh;
    /// What another process, or the same one after a restart, sees of the last fresh store.
    std::function<std::unique_ptr<Metadata>()> again;
};

/// What every metadata store has to do. A new implementation instantiates this suite with a maker.
class MetadataSuite : public testing::TestWithParam<MetadataMaker>
{
protected:
    void SetUp() override;

    NewShare shareOf(std::vector<std::uint64_t> sizes, Seconds now = 1000) const;
    ShareRecord make(std::vector<std::uint64_t> sizes, Seconds now = 1000);
    /// Makes a share, stores all its bytes, finishes it; the link's hash is `hash`.
    ShareRecord makeFinished(std::uint64_t size, const std::string &hash, Seconds now = 1000);

    static inline const std::string tokenHash = std::string(32, '\x01');
    static inline const std::string linkHash = std::string(32, '\x02');
    static inline const std::string otherLinkHash{"\0\x03 with a zero", 15};

    std::unique_ptr<Metadata> m_store;
    std::int64_t m_account = 0;
};

} // namespace pelliko::server

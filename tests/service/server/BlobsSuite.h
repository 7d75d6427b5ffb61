#pragma once

#include "store/Blobs.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::server
{

struct BlobsMaker {
    std::string name;
    std::function<std::unique_ptr<Blobs>()> fresh;
    std::function<std::unique_ptr<Blobs>()> again;
};

/// The keys of all blobs that there are, looked for so many at a time.
std::vector<std::string> keysOf(Blobs &blobs, std::size_t atOnce = 1000);

/// What every blob store has to do. A new implementation instantiates this suite with a maker.
class BlobsSuite : public testing::TestWithParam<BlobsMaker>
{
protected:
    void SetUp() override { m_store = GetParam().fresh(); }

    /// The blob's bytes, or "(absent)".
    static std::string contentOf(Blobs &blobs, const std::string &key);

    std::unique_ptr<Blobs> m_store;
};

} // namespace pelliko::server

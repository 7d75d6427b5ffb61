#include "store/PostgresMetadata.h"

#include "store/PostgresClock.h"
#include "store/PostgresLayout.h"
#include "store/PostgresPool.h"

namespace pelliko::server
{

PostgresMetadata::PostgresMetadata(const std::string &url, std::size_t connections)
    : m_pool(std::make_unique<PostgresPool>(url, connections)),
      m_clock(std::make_shared<PostgresClock>())
{
    PostgresConnection first(url);
    migrate(first);
    m_pool->single([this](PostgresConnection &db) { m_clock->set(db); });
}

PostgresMetadata::~PostgresMetadata() = default;

void PostgresMetadata::ping()
{
    m_pool->single([](PostgresConnection &db) { db.query("SELECT 1 FROM accounts LIMIT 1"); });
}

} // namespace pelliko::server

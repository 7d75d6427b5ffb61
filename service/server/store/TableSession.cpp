#include "store/TableSession.h"

namespace pelliko::server
{

std::optional<StoreMark> markOf(TableSession &session)
{
    std::optional<StoreMark> mark;
    if (session.hasTable("migration")) {
        session.query("SELECT mark FROM migration", {}, {Column::Kind::text},
                      [&](const TableRow &row) { mark = markOf(textIn(row, 0)); });
    }
    return mark;
}

void setMark(TableSession &session, const StoreMark &mark)
{
    session.change("CREATE TABLE IF NOT EXISTS migration"
                   " (one integer PRIMARY KEY, mark text NOT NULL)");
    session.change("INSERT INTO migration (one, mark) VALUES (1, $1)"
                   " ON CONFLICT (one) DO UPDATE SET mark = excluded.mark",
                   {textOf(mark)});
}

bool isEmpty(TableSession &session)
{
    bool empty = true;
    for (const Table &table : metadataTables())
        session.query("SELECT 1 FROM " + std::string(table.name) + " LIMIT 1", {},
                      {Column::Kind::integer}, [&](const TableRow &) { empty = false; });
    return empty;
}

} // namespace pelliko::server

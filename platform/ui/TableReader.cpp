#include "TableReader.h"

#include <Eina.h>
#include <glib.h>

#include <algorithm>
#include <memory>

namespace pelliko::ui
{

namespace
{

struct Reading {
    std::string root, entry;
    std::string palette; ///< palette around the current element
    int depth = 0;
    TableFile file;
};

TableEntry collect(const char **names, const char **values)
{
    TableEntry found;
    for (; *names; ++names, ++values)
        found.attributes[*names] = *values;
    return found;
}

void startElement(GMarkupParseContext *, const char *name, const char **names, const char **values,
                  void *data, GError **error)
{
    auto &reading = *static_cast<Reading *>(data);
    const TableEntry element = collect(names, values);
    if (reading.depth++ == 0) {
        if (reading.root != name)
            g_set_error(error, G_MARKUP_ERROR, G_MARKUP_ERROR_UNKNOWN_ELEMENT,
                        "begins with <%s>, not with <%s>", name, reading.root.c_str());
        reading.file.usual = element.get("palette");
    } else if (std::string("palette") == name) {
        reading.palette = element.get("name");
    } else if (reading.entry == name) {
        reading.file.entries.push_back({reading.palette, element});
    } else {
        g_set_error(error, G_MARKUP_ERROR, G_MARKUP_ERROR_UNKNOWN_ELEMENT, "has an unknown <%s>",
                    name);
    }
}

void endElement(GMarkupParseContext *, const char *name, void *data, GError **)
{
    auto &reading = *static_cast<Reading *>(data);
    --reading.depth;
    if (std::string("palette") == name)
        reading.palette.clear();
}

constexpr GMarkupParser parser{startElement, endElement, nullptr, nullptr, nullptr};

using Text = std::unique_ptr<char, decltype(&g_free)>;
using Context = std::unique_ptr<GMarkupParseContext, decltype(&g_markup_parse_context_unref)>;

} // namespace

std::string TableEntry::get(const std::string &name) const
{
    const auto found = attributes.find(name);
    return found == attributes.end() ? std::string() : found->second;
}

void reportTable(const char *path, const std::string &reason)
{
    EINA_LOG_ERR("table %s: %s", path ? path : "(null)", reason.c_str());
}

std::vector<TableEntry> TableFile::of(const std::string &palette) const
{
    const bool known = !palette.empty() &&
                       std::any_of(entries.begin(), entries.end(), [&palette](const Entry &entry) {
                           return entry.palette == palette;
                       });
    const std::string &chosen = known ? palette : usual;
    std::vector<TableEntry> found;
    for (const Entry &entry : entries)
        if (entry.palette.empty() || entry.palette == chosen)
            found.push_back(entry.attributes);
    return found;
}

std::optional<TableFile> readTable(const char *path, const std::string &root,
                                   const std::string &entry)
{
    if (!path)
        return std::nullopt;
    GError *error = nullptr;
    char *raw = nullptr;
    gsize length = 0;
    Reading reading{root, entry, {}, 0, {}};
    const Context context(
        g_markup_parse_context_new(&parser, GMarkupParseFlags{}, &reading, nullptr),
        g_markup_parse_context_unref);
    const bool read = g_file_get_contents(path, &raw, &length, &error) != FALSE;
    const Text contents(raw, g_free);
    if (read &&
        g_markup_parse_context_parse(context.get(), raw, static_cast<gssize>(length), &error) &&
        g_markup_parse_context_end_parse(context.get(), &error))
        return std::move(reading.file);
    reportTable(path, error ? error->message : "cannot be read");
    g_clear_error(&error);
    return std::nullopt;
}

} // namespace pelliko::ui

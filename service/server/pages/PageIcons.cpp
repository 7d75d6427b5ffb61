#include "pages/PageIcons.h"

#include "pages/BrandIcon.h"
#include "text/Base64.h"

namespace pelliko::server
{
namespace
{

/// Lines of two units on a square of 24.
std::string drawing(const char *lines)
{
    return std::string("<svg viewBox=\"0 0 24 24\" aria-hidden=\"true\">") + lines + "</svg>";
}

const char *linesOf(FileKind kind)
{
    switch (kind) {
    case FileKind::picture:
        return "<rect x=\"3\" y=\"4\" width=\"18\" height=\"16\" rx=\"3\"/>"
               "<circle cx=\"8.5\" cy=\"9.5\" r=\"1.5\"/><path d=\"m4 18.5 5-5 3.5 3 3.5-4 5 5\"/>";
    case FileKind::video:
        return "<rect x=\"3\" y=\"5\" width=\"18\" height=\"14\" rx=\"3\"/><path d=\"m10 9 5 3-5 "
               "3z\"/>";
    case FileKind::sound:
        return "<path d=\"M9 18V6l10-2v12\"/><circle cx=\"6.5\" cy=\"18\" r=\"2.5\"/>"
               "<circle cx=\"16.5\" cy=\"16\" r=\"2.5\"/>";
    case FileKind::text:
        return "<path d=\"M5 7h14M5 12h14M5 17h9\"/>";
    case FileKind::contact:
        return "<circle cx=\"12\" cy=\"8.5\" r=\"3.5\"/>"
               "<path d=\"M5 20c.6-4 3.4-6 7-6s6.4 2 7 6\"/>";
    case FileKind::document:
        return "<path d=\"M7 3h7l5 5v11a2 2 0 0 1-2 2H7a2 2 0 0 1-2-2V5a2 2 0 0 1 2-2z\"/>"
               "<path d=\"M14 3v5h5M9 13h6M9 17h4\"/>";
    case FileKind::archive:
        return "<rect x=\"3\" y=\"4\" width=\"18\" height=\"5\" rx=\"1.5\"/>"
               "<path d=\"M5 9v9a2 2 0 0 0 2 2h10a2 2 0 0 0 2-2V9M10 13h4\"/>";
    case FileKind::other:
        break;
    }
    return "<path d=\"M7 3h7l5 5v11a2 2 0 0 1-2 2H7a2 2 0 0 1-2-2V5a2 2 0 0 1 2-2z\"/>"
           "<path d=\"M14 3v5h5\"/>";
}

const char *linesOf(Mark mark)
{
    switch (mark) {
    case Mark::download:
        return "<path d=\"M12 4v11m-5-4.5 5 5 5-5M5 20h14\"/>";
    case Mark::clock:
        return "<circle cx=\"12\" cy=\"12\" r=\"8.5\"/><path d=\"M12 7v5l3.5 2\"/>";
    case Mark::takenBack:
        return "<path d=\"M8.5 4.5 4 9l4.5 4.5M4 9h10a5.5 5.5 0 0 1 0 11H8\"/>";
    case Mark::question:
        return "<path d=\"M8.5 8.5a3.5 3.5 0 1 1 5.3 3c-1.1.7-1.8 1.400-1.8 2.700M12 18.5v.01\"/>";
    case Mark::trouble:
        break;
    }
    return "<path d=\"M12 5v9M12 18.5v.01\"/>";
}

} // namespace

std::string iconOf(FileKind kind)
{
    return drawing(linesOf(kind));
}

std::string iconOf(Mark mark)
{
    return drawing(linesOf(mark));
}

const std::string &brandMark()
{
    static const std::string mark =
        std::string("<svg aria-hidden=\"true\" ").append(std::string_view(brandIcon).substr(5));
    return mark;
}

const std::string &brandAddress()
{
    static const std::string address = "data:image/svg+xml;base64," + base64(brandIcon);
    return address;
}

} // namespace pelliko::server

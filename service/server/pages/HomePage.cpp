#include "pages/HomePage.h"

#include "pages/PageFrame.h"

namespace pelliko::server
{

Response homePage(const PageLanguage &language)
{
    const std::string purpose =
        language.text("People share files, texts and contacts over this server with people whose "
                      "phone number they know.");
    PageContent content;
    content.heading = language.text("From person to person");
    content.content = paragraph(purpose) +
                      paragraph(language.text(
                          "If somebody shared something with you, open the link exactly as it "
                          "stands in the message. Each link works for a limited time."));
    content.title = "Pelliko";
    content.preview = purpose;
    return pageResponse(static_cast<int>(Status::ok), language, content);
}

} // namespace pelliko::server

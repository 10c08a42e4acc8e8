#include "UserNotice.h"

#include "host/MsgManData.h"

namespace {

CrvC_UserNotice::Warning &warningHandler()
{
    static CrvC_UserNotice::Warning handler;
    return handler;
}

CrvC_UserNotice::EmailOffer &emailOfferHandler()
{
    static CrvC_UserNotice::EmailOffer handler;
    return handler;
}

} // namespace

void CrvC_UserNotice::setHandlers(Warning warning, EmailOffer emailOffer)
{
    warningHandler() = std::move(warning);
    emailOfferHandler() = std::move(emailOffer);
}

void CrvC_UserNotice::warning(const QString &text, const QString &details)
{
    if (warningHandler())
        warningHandler()(text, details);
    else
        Port_MsgManData::debugStub("Corvid warning: %s %s\n", qUtf8Printable(text), qUtf8Printable(details));
}

void CrvC_UserNotice::offerEmail(const QString &reportFile)
{
    if (emailOfferHandler())
        emailOfferHandler()(reportFile);
}

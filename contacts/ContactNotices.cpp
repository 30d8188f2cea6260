#include "contacts/ContactNotices.h"

namespace orvanta {

namespace {
ContactNotices& notices()
{
    static ContactNotices n;
    return n;
}
} // namespace

void setContactNotices(ContactNotices n)
{
    notices() = std::move(n);
}

const ContactNotices& contactNotices()
{
    return notices();
}

} // namespace orvanta

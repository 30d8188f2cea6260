// Arbitrary bytes as an address-book CSV export: the reader never fails, every card it returns
// names somebody or holds a number, and each becomes a contact record without trouble.

#include "phone/ContactCards.h"
#include "phone/ContactCsv.h"

#include <cstddef>
#include <cstdint>

using namespace orvanta;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArrayView input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    const VCardReadResult result = readContactCsv(input);
    for (const VCardContact& card : result.cards) {
        if (card.isEmpty())
            __builtin_trap();
        const CardImport made = contactFromCard(card, 1 + static_cast<int>(size % 3));
        if (made.contact.CONTBEZ().size() > TvkMiniKontakt::width(TvkMiniKontakt::Field::CONTBEZ))
            __builtin_trap();
    }
    return 0;
}

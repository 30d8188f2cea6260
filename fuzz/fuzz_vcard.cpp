// Arbitrary bytes to the vCard reader: it never fails, what it read is written and read back with
// no complaint and the same cards, and a second round trip changes nothing.

#include "phone/VCard.h"

#include <cstddef>
#include <cstdint>

using namespace orvanta;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArrayView input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    const VCardReadResult first = readVCards(input);
    for (const VCardContact& card : first.cards) {
        if (card.isEmpty())
            __builtin_trap();
    }

    const VCardReadResult second = readVCards(writeVCards(first.cards));
    if (second.cards.size() != first.cards.size() || !second.messages.isEmpty() || second.skippedCards != 0)
        __builtin_trap();

    const VCardReadResult third = readVCards(writeVCards(second.cards));
    if (third.cards != second.cards)
        __builtin_trap();
    return 0;
}

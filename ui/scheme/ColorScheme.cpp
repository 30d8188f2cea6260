#include "ui/scheme/ColorScheme.h"

namespace orvanta {

namespace {
int g_scheme = 2;
}

int normalizedColorScheme(int value)
{
    return (value >= 0 && value <= 2) ? value : 2;
}

int appColorScheme()
{
    return g_scheme;
}

void setAppColorScheme(int value)
{
    g_scheme = normalizedColorScheme(value);
}

MainWindowColors mainWindowColors(int scheme)
{
    switch (normalizedColorScheme(scheme)) {
    case 0:
        return {0, colorFromBgr(0xF9DAC3), colorFromBgr(0xFCE1CB), colorFromBgr(0xE0A57D), colorFromBgr(0x962D00)};
    case 1:
        return {2, colorFromBgr(0xE4F0F2), colorFromBgr(0xCFF0EA), colorFromBgr(0x8CC0B1), colorFromBgr(0x588060)};
    default:
        return {1, colorFromBgr(0xF7F3F3), colorFromBgr(0xECE2E1), colorFromBgr(0xB39698), colorFromBgr(0x987C80)};
    }
}

} // namespace orvanta

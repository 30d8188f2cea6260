#include "ui/scheme/ColorScheme.h"

#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"

#include <array>

namespace orvanta {

namespace {
int g_scheme = 2;

// One row per scheme: 0 blue, 1 olive, 2 silver.
template <typename Colors>
using SchemeTable = std::array<Colors, 3>;

template <typename Colors>
const Colors& entryOf(const SchemeTable<Colors>& table, int scheme)
{
    return table[static_cast<size_t>(normalizedColorScheme(scheme))];
}

const SchemeTable<MainWindowColors>& mainWindowTable()
{
    static const SchemeTable<MainWindowColors> table{{
        {0, colorFromBgr(0xF9DAC3), colorFromBgr(0xFCE1CB), colorFromBgr(0xE0A57D), colorFromBgr(0x962D00)},
        {2, colorFromBgr(0xE4F0F2), colorFromBgr(0xCFF0EA), colorFromBgr(0x8CC0B1), colorFromBgr(0x588060)},
        {1, colorFromBgr(0xF7F3F3), colorFromBgr(0xECE2E1), colorFromBgr(0xB39698), colorFromBgr(0x987C80)},
    }};
    return table;
}

const SchemeTable<ListFrameColors>& listFrameTable()
{
    static const SchemeTable<ListFrameColors> table{{
        {QColor(0xC3DAF9), QColor(0x002C98), QColor(0x033893), QColor(0x5987D6), QColor(0x002C98), QColor(0xC3DAF9),
         QColor(0x002D96), colorFromBgr(0xFCE1CB), colorFromBgr(0xE0A57D), colorFromBgr(0x962D00),
         colorFromBgr(0x6A2000)},
        {QColor(0xF2F0E4), QColor(0x788C60), QColor(0x688048), QColor(0xB0C080), QColor(0x788C60), QColor(0xF2F0E4),
         QColor(0x608058), colorFromBgr(0xCFF0EA), colorFromBgr(0x8CC0B1), colorFromBgr(0x588060),
         colorFromBgr(0x2C3F30)},
        {QColor(0xF3F3F7), QColor(0x787C90), QColor(0x757495), QColor(0xA5A4BD), QColor(0x787C90), QColor(0xF3F3F7),
         QColor(0x807C98), colorFromBgr(0xECE2E1), colorFromBgr(0xB39698), colorFromBgr(0x987C80),
         colorFromBgr(0x4E3D3F)},
    }};
    return table;
}

const SchemeTable<DetailWindowColors>& detailWindowTable()
{
    static const SchemeTable<DetailWindowColors> table{{
        {QColor(0xC3DAF9), QColor(0x033893), QColor(0x002C98)},
        {QColor(0xF2F0E4), QColor(0x688048), QColor(0x788C60)},
        {QColor(0xF3F3F7), QColor(0x757495), QColor(0x787C90)},
    }};
    return table;
}

const SchemeTable<PrintWindowColors>& printWindowTable()
{
    static const SchemeTable<PrintWindowColors> table{{
        {colorFromBgr(16640730), colorFromBgr(14986888), colorFromBgr(16572875), colorFromBgr(9841920), 2},
        {colorFromBgr(13627626), colorFromBgr(9224369), colorFromBgr(15003890), colorFromBgr(5800032), 3},
        {colorFromBgr(15524577), colorFromBgr(11769496), colorFromBgr(15524577), colorFromBgr(9993344), 4},
    }};
    return table;
}

} // namespace

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

int loadAppColorScheme()
{
    const IniFile scheme(programFile(QStringLiteral("OScheme")));
    setAppColorScheme(scheme.readInteger(QStringLiteral("AppColor"), QStringLiteral("Value"), 2));
    return appColorScheme();
}

MainWindowColors mainWindowColors(int scheme)
{
    return entryOf(mainWindowTable(), scheme);
}

const ListFrameColors& listFrameColors(int scheme)
{
    return entryOf(listFrameTable(), scheme);
}

const DetailWindowColors& detailWindowColors(int scheme)
{
    return entryOf(detailWindowTable(), scheme);
}

const PrintWindowColors& printWindowColors(int scheme)
{
    return entryOf(printWindowTable(), scheme);
}

const EditorDialogColors& editorDialogColors(int scheme)
{
    static const SchemeTable<EditorDialogColors> table{{
        {colorFromBgr(0xF9DAC3), colorFromBgr(0x962D00), colorFromBgr(0xF5BFA0), colorFromBgr(0x10AFF9)},
        {colorFromBgr(0xE4F0F2), colorFromBgr(0x588060), colorFromBgr(0xAADADA), colorFromBgr(0x10AFF9)},
        {colorFromBgr(0xF7F3F3), colorFromBgr(0x987C80), colorFromBgr(0xE6D8D8), colorFromBgr(0x10AFF9)},
    }};
    return entryOf(table, scheme);
}

} // namespace orvanta

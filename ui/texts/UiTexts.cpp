#include "ui/texts/UiTexts.h"

#include <array>

namespace orvanta {

namespace {

std::array<QString, static_cast<std::size_t>(UiText::Count)>& texts()
{
    static std::array<QString, static_cast<std::size_t>(UiText::Count)> t = {
        QStringLiteral("<No data to display>"), QStringLiteral("Drag a column header here to group by that column"),
        QStringLiteral("<none>"), QStringLiteral("Undo"), QStringLiteral("Redo"), QStringLiteral("Cut"),
        QStringLiteral("Copy"), QStringLiteral("Paste"), QStringLiteral("Delete"), QStringLiteral("Select All"),
        QStringLiteral("Today"), QStringLiteral("Add or Remove Buttons"), QStringLiteral("More Buttons"),
        QStringLiteral("Reset Toolbar"), QStringLiteral("Are you sure you want to reset the changes made to the '%s' toolbar?"),
        QStringLiteral("(automatic)"), QStringLiteral("(custom)")};
    return t;
}

std::array<QString, 16>& colorNames()
{
    static std::array<QString, 16> n = {
        QStringLiteral("Black"), QStringLiteral("Maroon"), QStringLiteral("Green"), QStringLiteral("Olive"),
        QStringLiteral("Navy"),  QStringLiteral("Purple"), QStringLiteral("Teal"),  QStringLiteral("Gray"),
        QStringLiteral("Silver"), QStringLiteral("Red"),   QStringLiteral("Lime"),  QStringLiteral("Yellow"),
        QStringLiteral("Blue"),  QStringLiteral("Fuchsia"), QStringLiteral("Aqua"), QStringLiteral("White")};
    return n;
}

} // namespace

QString uiText(UiText key)
{
    const auto i = static_cast<std::size_t>(key);
    return i < texts().size() ? texts()[i] : QString();
}

void setUiText(UiText key, const QString& text)
{
    const auto i = static_cast<std::size_t>(key);
    if (i < texts().size())
        texts()[i] = text;
}

QString uiColorName(int index)
{
    return (index >= 0 && index < 16) ? colorNames()[static_cast<std::size_t>(index)] : QString();
}

void setUiColorName(int index, const QString& name)
{
    if (index >= 0 && index < 16)
        colorNames()[static_cast<std::size_t>(index)] = name;
}

} // namespace orvanta

#pragma once
// A report layout as the report file describes it: pages of bands, each band a list of items placed
// in millimetres. Plain data; ReportParser builds it, ReportEngine lays it out.

#include <QColor>
#include <QList>
#include <QMarginsF>
#include <QRectF>
#include <QSizeF>
#include <QString>

namespace orvanta {

struct ReportFont {
    QString family; // empty: the report's font
    double size = 0; // points; 0: the report's size
    bool bold = false;
    bool italic = false;
};

struct ReportItem {
    enum class Kind {
        Text, // a text with {Name} placeholders for fields, parameters and page data
        RichText, // a parameter holding RTF (or plain text), flowing over as many pages as it needs
        Line, // from the rectangle's top left to its bottom right
        Box, // a frame, optionally filled
    };
    Kind kind = Kind::Text;
    QRectF rect; // millimetres, relative to the band's top left
    QString text; // Text: the template; RichText: the parameter name
    ReportFont font;
    Qt::Alignment align = Qt::AlignLeft | Qt::AlignVCenter;
    QColor color = Qt::black;
    QColor fill; // Box only; invalid = no fill
    double penWidth = 0.2; // millimetres; Line and Box
    int line = 0; // where the file defines it, for messages
};

struct ReportBand {
    enum class Kind { Title, PageHeader, GroupHeader, Detail, GroupFooter, PageFooter, Summary };
    Kind kind = Kind::Detail;
    double height = 0; // millimetres
    QString groupBy; // GroupHeader/GroupFooter: the field whose change starts a new group
    QString shadeField; // Detail: rows whose field is "T" get the shade colour
    QColor shade;
    QList<ReportItem> items;
    int line = 0;
};

struct ReportDefinition {
    QString name;
    QSizeF paper{210, 297}; // millimetres
    QMarginsF margins{20, 15, 15, 15}; // left, top, right, bottom; millimetres
    ReportFont font{QStringLiteral("Arial"), 9, false, false};
    QString title; // the preview's window title; empty: the report's name
    QList<ReportBand> bands;
    int line = 0;

    [[nodiscard]] const ReportBand* band(ReportBand::Kind kind) const
    {
        for (const ReportBand& b : bands)
            if (b.kind == kind)
                return &b;
        return nullptr;
    }
    [[nodiscard]] QSizeF printable() const
    {
        return {paper.width() - margins.left() - margins.right(), paper.height() - margins.top() - margins.bottom()};
    }
};

struct ReportProject {
    QList<ReportDefinition> reports;

    [[nodiscard]] const ReportDefinition* find(const QString& name) const
    {
        for (const ReportDefinition& r : reports)
            if (r.name.compare(name, Qt::CaseInsensitive) == 0)
                return &r;
        return nullptr;
    }
};

} // namespace orvanta

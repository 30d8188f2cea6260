#pragma once
// Lays a report out into pages: which band goes where on which page, with the row it shows.
// Pages are laid out on demand, so the first one can be shown while the rest are still coming;
// what a page holds is a short list of placements, its drawing is made when it is painted.

#include "ui/report/ReportDataSource.h"
#include "ui/report/ReportDefinition.h"

#include <QDateTime>
#include <QHash>

#include <memory>

class QTextDocument;

namespace orvanta {

struct ReportParameters {
    QHash<QString, QString> text;
    QHash<QString, QByteArray> rich; // RTF or plain text, for richtext items
};

class ReportLayout final {
public:
    // Layout coordinates: 1/1200 inch, so a PDF written at 1200 dpi needs no scaling.
    static constexpr double kDotsPerInch = 1200;
    static constexpr double kDotsPerMm = kDotsPerInch / 25.4;

    struct Placement {
        const ReportBand* band = nullptr;
        double y = 0; // dots below the printable area's top
        int row = -1; // index into the layout's rows; -1: none
        // Rich text shown from this band: the document's slice [richFrom, richTo) in dots.
        const ReportItem* rich = nullptr;
        double richFrom = 0;
        double richTo = 0;
        bool continued = false; // the rich text's continuation: the band's other items are not repeated
    };
    struct Page {
        QList<Placement> placements;
    };

    // The source may be null for reports without rows; it must outlive the layout.
    ReportLayout(ReportDefinition definition, ReportParameters parameters, ReportDataSource* source,
                 QDateTime printedAt);
    ~ReportLayout();
    Q_DISABLE_COPY_MOVE(ReportLayout)

    // Checks every name the layout uses against the fields and parameters and opens the source.
    // Throws AppException with the report's name and the file's line of the first unknown name.
    void start();
    // Lays out at least `pages` more pages unless the report ends first; true once it has ended.
    bool layoutMore(int pages = 1);
    void layoutAll();
    [[nodiscard]] bool finished() const { return m_finished; }

    [[nodiscard]] int pageCount() const { return int(m_pages.size()); }
    // Pages that will not change any more (all of them once finished).
    [[nodiscard]] int completePages() const { return m_finished ? pageCount() : std::max(0, pageCount() - 1); }
    [[nodiscard]] const Page& page(int index) const { return m_pages.at(index); }
    [[nodiscard]] const ReportDefinition& definition() const { return m_definition; }
    [[nodiscard]] QSizeF paperDots() const { return m_definition.paper * kDotsPerMm; }
    // A template split once into literal text and what its names stand for, so that painting a
    // cell needs no parsing and no name lookup.
    struct TemplatePart {
        enum class Kind { Literal, Field, Parameter, Page, Pages, Date, Time };
        Kind kind = Kind::Literal;
        QString text; // Literal: the text; Parameter: its value
        int field = -1;
    };
    using Template = QList<TemplatePart>;
    [[nodiscard]] Template compile(const QString& templ) const;
    // The text of a template for one row on one page ({Seiten} is the count laid out so far).
    [[nodiscard]] QString expand(const QString& templ, int row, int pageIndex) const;
    // The same into `out`; a template that is one field gives a view of the row's value and
    // leaves `out` alone.
    [[nodiscard]] QStringView expand(const Template& templ, int row, int pageIndex, QString& out) const;
    [[nodiscard]] QTextDocument* richDocument(const ReportItem* item) const;
    [[nodiscard]] bool isShaded(const ReportBand& band, int row) const;

private:
    struct Level {
        const ReportBand* header = nullptr;
        const ReportBand* footer = nullptr;
        int field = -1;
    };

    void checkNames() const;
    void checkName(const QString& name, int line) const;
    void newPage();
    void closePage();
    void place(const ReportBand* band, int row);
    void placeFlowing(const ReportBand* band, int row);
    [[nodiscard]] double bandHeight(const ReportBand* band) const { return band ? band->height * kDotsPerMm : 0; }
    [[nodiscard]] double bottom() const;
    [[nodiscard]] double breakBefore(QTextDocument* doc, double from, double limit) const;
    void step();

    ReportDefinition m_definition;
    ReportParameters m_parameters;
    ReportDataSource* m_source;
    QDateTime m_printedAt;
    QHash<QString, int> m_fieldIndex;
    QList<int> m_shadeField; // per band of the definition: the field deciding its shade, or -1
    QList<Level> m_levels;
    const ReportBand* m_title = nullptr;
    const ReportBand* m_pageHeader = nullptr;
    const ReportBand* m_detail = nullptr;
    const ReportBand* m_pageFooter = nullptr;
    const ReportBand* m_summary = nullptr;
    QHash<const ReportItem*, std::shared_ptr<QTextDocument>> m_rich;

    mutable int m_richBlock = 0; // where the rich text's next page break is searched from
    // Every row's values in one string, separated by kUnit: a long report holds its rows, and
    // one string per row costs a fraction of a list of strings.
    QList<QString> m_rows;
    [[nodiscard]] QStringView value(int row, int field) const;
    QList<Page> m_pages;
    double m_y = 0;
    double m_contentTop = 0; // below the page header: a page with nothing further is empty
    bool m_pageOpen = false;
    bool m_started = false;
    bool m_finished = false;
    bool m_rowsDone = false;
    int m_lastRow = -1;
};

} // namespace orvanta

#include "ui/grid/GridSearchPanel.h"

#include "platform/DialogService.h"

#include <QAction>
#include <QCheckBox>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QMenu>
#include <QMouseEvent>
#include <QPushButton>
#include <QToolButton>

namespace orvanta {
namespace {

// A label that acts as a link: underlined, a hand cursor, clicked on a left click.
class LinkLabel final : public QLabel {
public:
    LinkLabel(const QString& text, QWidget* parent, std::function<void()> clicked)
        : QLabel(text, parent)
        , m_clicked(std::move(clicked))
    {
        QFont f = font();
        f.setUnderline(true);
        setFont(f);
        setCursor(Qt::PointingHandCursor);
    }

protected:
    void mouseReleaseEvent(QMouseEvent* event) override
    {
        if (event->button() == Qt::LeftButton && isEnabled() && rect().contains(event->position().toPoint()))
            m_clicked();
        QLabel::mouseReleaseEvent(event);
    }

private:
    std::function<void()> m_clicked;
};

} // namespace

GridSearchPanel::GridSearchPanel(const QStringList& columns, QWidget* parent)
    : QFrame(parent)
{
    setObjectName(QStringLiteral("RzPanel1"));
    // Collapsed, the panel must not dictate the frame's width: the lists have to fit narrow windows.
    setSizePolicy(QSizePolicy::Ignored, QSizePolicy::Fixed);
    auto* grid = new QGridLayout(this);
    grid->setContentsMargins(4, 2, 4, 2);
    grid->setVerticalSpacing(2);
    grid->setSizeConstraint(QLayout::SetNoConstraint);

    m_text = new QLineEdit(this);
    m_text->setObjectName(QStringLiteral("cxTE1"));
    m_text->setMinimumWidth(120);
    connect(m_text, &QLineEdit::returnPressed, this, &GridSearchPanel::startSearch);

    m_columns = new QToolButton(this);
    m_columns->setObjectName(QStringLiteral("cxCheckComboBox1"));
    m_columns->setPopupMode(QToolButton::InstantPopup);
    m_columns->setToolButtonStyle(Qt::ToolButtonTextOnly);
    m_columns->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
    m_columns->setMinimumWidth(120);
    m_columnMenu = new QMenu(m_columns);
    m_columnMenu->setObjectName(QStringLiteral("cxCheckComboBox1Items"));
    for (const QString& caption : columns) {
        QAction* a = m_columnMenu->addAction(caption);
        a->setCheckable(true);
        connect(a, &QAction::toggled, this, &GridSearchPanel::updateColumnText);
    }
    m_columns->setMenu(m_columnMenu);

    static const char* const names[3] = {"RzChB1", "RzChB2", "RzChB3"};
    const QString texts[3] = {QStringLiteral("aktuellen Filter auf Suchergebnis anwenden"),
                              QStringLiteral("genaue Suche"), QStringLiteral("Groß-/Kleinschreibung berücksichtigen")};
    for (int i = 0; i < 3; ++i) {
        m_options[i] = new QCheckBox(texts[i], this);
        m_options[i]->setObjectName(QLatin1String(names[i]));
    }
    m_clear = new LinkLabel(QStringLiteral("» Suchmaske löschen «"), this, [this] { clearMask(); });
    m_clear->setObjectName(QStringLiteral("L3"));
    m_start = new QPushButton(QStringLiteral("Jetzt suchen"), this);
    m_start->setObjectName(QStringLiteral("ADVSearchStart"));
    connect(m_start, &QPushButton::clicked, this, &GridSearchPanel::startSearch);
    m_close = new QPushButton(QStringLiteral("X"), this);
    m_close->setObjectName(QStringLiteral("AdvCloseSearchPan"));
    m_close->setToolTip(QStringLiteral("Suche schließen"));
    m_close->setFixedWidth(m_close->fontMetrics().horizontalAdvance(QStringLiteral("XX")) + 12);
    connect(m_close, &QPushButton::clicked, this, &GridSearchPanel::closeRequested);

    // Row one: what and where, the buttons; row two: the options and the link.
    grid->addWidget(new QLabel(QStringLiteral("Suchen nach:"), this), 0, 0);
    grid->addWidget(m_text, 0, 1);
    grid->addWidget(new QLabel(QStringLiteral("Suchen in:"), this), 0, 2);
    grid->addWidget(m_columns, 0, 3);
    grid->addWidget(m_start, 0, 4);
    grid->addWidget(m_close, 0, 5);
    auto* options = new QHBoxLayout();
    options->setContentsMargins(0, 0, 0, 0);
    for (QCheckBox* box : m_options)
        options->addWidget(box);
    options->addStretch(1);
    options->addWidget(m_clear);
    grid->addLayout(options, 1, 0, 1, 6);
    grid->setColumnStretch(1, 2);
    grid->setColumnStretch(3, 1);
    updateColumnText();
}

QString GridSearchPanel::missingInputWarning()
{
    return QStringLiteral("Bitte geben Sie einen Begriff, nach dem gesucht werden soll, in das Feld \"Suchen nach\" "
                          "ein bzw. wählen Sie mindestens eine Spalte in Feld \"Suchen in\" aus!");
}

void GridSearchPanel::reset()
{
    m_open = false;
    setFixedHeight(1);
    setChosenColumns({});
    m_columns->setEnabled(false);
    for (QCheckBox* box : m_options) {
        box->setChecked(false);
        box->setEnabled(false);
    }
    m_clear->hide();
    m_text->clear();
    m_text->setEnabled(false);
    m_start->setEnabled(false);
}

void GridSearchPanel::open()
{
    m_open = true;
    for (QWidget* w : {static_cast<QWidget*>(m_text), static_cast<QWidget*>(m_columns), static_cast<QWidget*>(m_start)})
        w->setEnabled(true);
    for (QCheckBox* box : m_options)
        box->setEnabled(true);
    m_clear->show();
    if (chosenColumns().isEmpty()) {
        for (QAction* a : m_columnMenu->actions())
            a->setChecked(true);
    }
    setMinimumHeight(0);
    setMaximumHeight(QWIDGETSIZE_MAX);
    setFixedHeight(layout()->sizeHint().height());
    m_text->setFocus();
    m_text->selectAll();
}

QString GridSearchPanel::searchText() const
{
    return m_text->text();
}

void GridSearchPanel::setSearchText(const QString& text)
{
    m_text->setText(text);
}

QStringList GridSearchPanel::chosenColumns() const
{
    QStringList out;
    for (const QAction* a : m_columnMenu->actions())
        if (a->isChecked())
            out << a->text();
    return out;
}

void GridSearchPanel::setChosenColumns(const QStringList& captions)
{
    for (QAction* a : m_columnMenu->actions())
        a->setChecked(captions.contains(a->text()));
    updateColumnText();
}

bool GridSearchPanel::narrowsFilter() const
{
    return m_options[0]->isChecked();
}

void GridSearchPanel::setNarrowsFilter(bool on)
{
    m_options[0]->setChecked(on);
}

bool GridSearchPanel::exact() const
{
    return m_options[1]->isChecked();
}

bool GridSearchPanel::caseSensitive() const
{
    return m_options[2]->isChecked();
}

void GridSearchPanel::updateColumnText()
{
    const QStringList chosen = chosenColumns();
    const qsizetype all = m_columnMenu->actions().size();
    m_columns->setText(chosen.isEmpty() ? QString()
                       : chosen.size() == all && all > 1 ? QStringLiteral("alle Spalten")
                                                         : chosen.join(QStringLiteral(", ")));
    m_columns->setToolTip(chosen.join(QStringLiteral(", ")));
}

void GridSearchPanel::startSearch()
{
    if (!m_open)
        return;
    if (m_text->text().isEmpty() || chosenColumns().isEmpty()) {
        dialogs().warning(missingInputWarning());
        return;
    }
    Q_EMIT searchRequested();
}

void GridSearchPanel::clearMask()
{
    m_text->clear();
    for (QAction* a : m_columnMenu->actions())
        a->setChecked(true);
    Q_EMIT clearRequested();
    m_text->setFocus();
}

} // namespace orvanta

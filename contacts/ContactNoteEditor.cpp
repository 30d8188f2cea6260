#include "contacts/ContactNoteEditor.h"

#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/Windows1252.h"
#include "ui/rtf/RtfText.h"

#include <QAction>
#include <QActionGroup>
#include <QComboBox>
#include <QCoreApplication>
#include <QFileDialog>
#include <QFileInfo>
#include <QFontComboBox>
#include <QPainter>
#include <QSaveFile>
#include <QSpinBox>
#include <QStyle>
#include <QTextBlock>
#include <QTextCursor>
#include <QTextEdit>
#include <QTextList>
#include <QToolBar>

#include <stdexcept>

namespace orvanta {

namespace {

const QString kFileFilter = QStringLiteral("Richtext (*.rtf);;Text (*.txt)");
constexpr const char* kBarSection = "ContactEdit";

ContactNoteEditor::NotePrinter& notePrinter()
{
    static ContactNoteEditor::NotePrinter p;
    return p;
}

ContactNoteEditor::FileChooser& fileChooser()
{
    static ContactNoteEditor::FileChooser c;
    return c;
}

QString chooseFile(QWidget* parent, bool save)
{
    const QString folder = QCoreApplication::applicationDirPath();
    if (fileChooser())
        return fileChooser()(parent, save, folder, kFileFilter);
    QFileDialog dialog(parent, QString(), folder, kFileFilter);
    dialog.setAcceptMode(save ? QFileDialog::AcceptSave : QFileDialog::AcceptOpen);
    if (save)
        dialog.setDefaultSuffix(QStringLiteral("rtf"));
    // The program asks about overwriting itself.
    dialog.setOption(QFileDialog::DontConfirmOverwrite);
    return dialog.exec() == QDialog::Accepted && !dialog.selectedFiles().isEmpty() ? dialog.selectedFiles().first()
                                                                                    : QString();
}

struct ColorEntry {
    const char* name;
    QRgb rgb;
};
constexpr ColorEntry kColors[] = {
    {"Schwarz", 0x000000}, {"Kastanienbraun", 0x800000}, {"Grün", 0x008000}, {"Olivgrün", 0x808000},
    {"Marineblau", 0x000080}, {"Violett", 0x800080},      {"Blaugrün", 0x008080}, {"Grau", 0x808080},
    {"Silber", 0xC0C0C0},  {"Rot", 0xFF0000},            {"Hellgrün", 0x00FF00}, {"Gelb", 0xFFFF00},
    {"Blau", 0x0000FF},    {"Fuchsia", 0xFF00FF},        {"Aqua", 0x00FFFF},     {"Weiß", 0xFFFFFF},
};

// Small drawn icons for the note tool bar, so that it needs no icon theme.
QIcon drawnIcon(const std::function<void(QPainter&)>& draw)
{
    QPixmap pm(16, 16);
    pm.fill(Qt::transparent);
    QPainter p(&pm);
    p.setRenderHint(QPainter::Antialiasing);
    p.setPen(QPen(QColor(40, 40, 40), 1));
    draw(p);
    return QIcon(pm);
}

QIcon letterIcon(const QString& letter, int styleBit)
{
    return drawnIcon([&](QPainter& p) {
        QFont f(QStringLiteral("Serif"));
        f.setPixelSize(13);
        f.setBold(styleBit == 1);
        f.setItalic(styleBit == 2);
        f.setUnderline(styleBit == 4);
        f.setStrikeOut(styleBit == 8);
        p.setFont(f);
        p.drawText(QRect(0, 0, 16, 16), Qt::AlignCenter, letter);
    });
}

QIcon alignIcon(int tag)
{
    return drawnIcon([tag](QPainter& p) {
        const int widths[] = {12, 8, 12, 6};
        for (int i = 0; i < 4; ++i) {
            const int w = widths[i];
            const int x = tag == 0 ? 2 : tag == 1 ? 14 - w : 8 - w / 2;
            p.drawLine(x, 3 + i * 3, x + w, 3 + i * 3);
        }
    });
}

QIcon bulletIcon()
{
    return drawnIcon([](QPainter& p) {
        p.setBrush(QColor(40, 40, 40));
        for (int i = 0; i < 3; ++i) {
            p.drawEllipse(QPointF(3.5, 3.5 + i * 4.5), 1.3, 1.3);
            p.drawLine(7, 4 + i * 4, 14, 4 + i * 4);
        }
    });
}

QIcon copyIcon(bool paste)
{
    return drawnIcon([paste](QPainter& p) {
        p.setBrush(Qt::white);
        if (paste) {
            p.drawRect(2, 3, 10, 12);
            p.drawRect(5, 1, 4, 3);
            p.drawRect(7, 7, 7, 8);
        } else {
            p.drawRect(2, 2, 8, 9);
            p.drawRect(6, 5, 8, 9);
        }
    });
}

} // namespace

ContactNoteEditor::ContactNoteEditor(QWidget* parent)
    : QMainWindow(parent)
{
    setWindowFlags(Qt::Widget); // the constructor always makes a window of it
    setObjectName(QStringLiteral("NoteBarHost"));
    m_notiz1 = new QTextEdit(this);
    m_notiz1->setObjectName(QStringLiteral("Notiz1"));
    m_notiz1->setAcceptRichText(true);
    m_notiz1->setFont(QFont(QStringLiteral("Arial"), 8));
    m_notiz1->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOn);
    m_notiz1->setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOn);
    m_notiz1->setLineWrapMode(QTextEdit::NoWrap);
    setCentralWidget(m_notiz1);
    buildToolBars();
    connect(m_notiz1, &QTextEdit::cursorPositionChanged, this, &ContactNoteEditor::RichEditSelectionChange);
    connect(m_notiz1, &QTextEdit::currentCharFormatChanged, this, &ContactNoteEditor::RichEditSelectionChange);
}

ContactNoteEditor::~ContactNoteEditor() = default;

void ContactNoteEditor::setNotePrinter(NotePrinter printer)
{
    notePrinter() = std::move(printer);
}

void ContactNoteEditor::setFileChooser(FileChooser chooser)
{
    fileChooser() = std::move(chooser);
}

void ContactNoteEditor::buildToolBars()
{
    QMainWindow* host = this;
    QStyle* st = style();
    const auto bar = [host](const char* name, const char* caption) {
        auto* tb = new QToolBar(QString::fromUtf8(caption), host);
        tb->setObjectName(QLatin1String(name));
        tb->setIconSize(QSize(16, 16));
        host->addToolBar(Qt::TopToolBarArea, tb);
        return tb;
    };
    const auto item = [](QToolBar* tb, const char* name, const char* caption, const QIcon& icon = {}) {
        QAction* a = tb->addAction(icon, QString::fromUtf8(caption));
        a->setObjectName(QLatin1String(name));
        a->setToolTip(QString::fromUtf8(caption));
        return a;
    };

    QToolBar* file = bar("dxBarOpenSave", "Öffnen/Speichern");
    connect(item(file, "dxBB1", "Öffnen", st->standardIcon(QStyle::SP_DialogOpenButton)), &QAction::triggered, this,
            &ContactNoteEditor::openNote);
    connect(item(file, "dxBB2", "Speichern", st->standardIcon(QStyle::SP_DialogSaveButton)), &QAction::triggered,
            this, &ContactNoteEditor::saveNote);
    connect(item(file, "dxBB3", "Drucken", st->standardIcon(QStyle::SP_FileDialogDetailedView)), &QAction::triggered,
            this, &ContactNoteEditor::printNote);

    QToolBar* clip = bar("dxBarCopy", "Kopieren");
    connect(item(clip, "dxBB4", "Ausschneiden", letterIcon(QStringLiteral("\u2702"), 0)), &QAction::triggered,
            m_notiz1, &QTextEdit::cut);
    connect(item(clip, "dxBB5", "Kopieren", copyIcon(false)), &QAction::triggered, m_notiz1, &QTextEdit::copy);
    connect(item(clip, "dxBB6", "Einfügen", copyIcon(true)), &QAction::triggered, m_notiz1, &QTextEdit::paste);

    QToolBar* format = bar("dxBarFormat", "Textformatierung");
    const struct {
        const char* name;
        const char* caption;
        const char* glyph;
        int bit;
    } styles[] = {{"dxBB7", "Fett", "F", 1}, {"dxBB8", "Kursiv", "K", 2}, {"dxBB9", "Unterstrichen", "U", 4},
                  {"dxBB10", "Durchgestrichen", "S", 8}};
    for (int i = 0; i < 4; ++i) {
        QAction* a = item(format, styles[i].name, styles[i].caption,
                          letterIcon(QString::fromUtf8(styles[i].glyph), styles[i].bit));
        a->setCheckable(true);
        const int bit = styles[i].bit;
        connect(a, &QAction::toggled, this, [this, bit](bool on) { setStyleBit(bit, on); });
        m_style[i] = a;
    }

    QToolBar* align = bar("dxBarAlign", "Positionierung");
    m_align = new QActionGroup(this);
    m_align->setExclusive(true);
    const struct {
        const char* name;
        const char* caption;
        int tag;
    } aligns[] = {{"dxBB11", "Linksbündig", 0}, {"dxBB12", "Zentriert", 2}, {"dxBB13", "Rechtsbündig", 1}};
    for (const auto& a : aligns) {
        QAction* action = item(align, a.name, a.caption, alignIcon(a.tag));
        action->setCheckable(true);
        action->setData(a.tag);
        m_align->addAction(action);
        const int tag = a.tag;
        connect(action, &QAction::triggered, this, [this, tag] { setAlignment(tag); });
    }

    host->addToolBarBreak(Qt::TopToolBarArea);
    QToolBar* list = bar("dxBarList", "Aufzählung");
    m_bullets = item(list, "dxBB14", "Aufzählung", bulletIcon());
    m_bullets->setCheckable(true);
    connect(m_bullets, &QAction::toggled, this, &ContactNoteEditor::setBullets);

    QToolBar* font = bar("dxBarFont", "Font");
    m_fontName = new QFontComboBox(font);
    m_fontName->setObjectName(QStringLiteral("dxBFNC1"));
    m_fontName->setToolTip(QStringLiteral("Schriftart"));
    m_fontName->setMaximumWidth(170);
    font->addWidget(m_fontName);
    connect(m_fontName, &QFontComboBox::currentFontChanged, this,
            [this](const QFont& f) { setFontName(f.family()); });
    m_fontSize = new QSpinBox(font);
    m_fontSize->setObjectName(QStringLiteral("dxBSE1"));
    m_fontSize->setToolTip(QStringLiteral("Schriftgröße"));
    m_fontSize->setRange(0, 400);
    font->addWidget(m_fontSize);
    connect(m_fontSize, &QSpinBox::valueChanged, this, &ContactNoteEditor::setFontSize);
    m_fontColor = new QComboBox(font);
    m_fontColor->setObjectName(QStringLiteral("dxBCC1"));
    m_fontColor->setToolTip(QStringLiteral("Schriftfarbe"));
    for (const ColorEntry& c : kColors) {
        QPixmap swatch(12, 12);
        swatch.fill(QColor::fromRgb(c.rgb));
        m_fontColor->addItem(QIcon(swatch), QString::fromUtf8(c.name), QColor::fromRgb(c.rgb));
    }
    font->addWidget(m_fontColor);
    connect(m_fontColor, &QComboBox::activated, this, &ContactNoteEditor::setFontColor);
}

void ContactNoteEditor::loadBars()
{
    const IniFile store(programFile(QStringLiteral("BarStore")));
    const QByteArray state =
        QByteArray::fromBase64(store.readString(QLatin1String(kBarSection), QStringLiteral("State")).toLatin1());
    if (!state.isEmpty() && !restoreState(state, 1))
        for (QToolBar* tb : findChildren<QToolBar*>())
            tb->setVisible(true);
}

void ContactNoteEditor::saveBars()
{
    IniFile store(programFile(QStringLiteral("BarStore")));
    store.setPath(programFile(QStringLiteral("BarStore")));
    store.writeString(QLatin1String(kBarSection), QStringLiteral("State"),
                      QString::fromLatin1(saveState(1).toBase64()));
    (void)store.save();
}

void ContactNoteEditor::openNote()
{
    const QString path = chooseFile(this, false);
    if (path.isEmpty())
        return;
    try {
        RtfText::loadFile(path, m_notiz1);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Tcontacteditform - Öffnen"), &e);
    }
}

void ContactNoteEditor::saveNote()
{
    const QString path = chooseFile(this, true);
    if (path.isEmpty())
        return;
    if (QFileInfo::exists(path)
        && dialogs().question(QStringLiteral("Überschreiben?"),
                              DialogButton::Yes | DialogButton::No | DialogButton::Cancel, DialogButton::Yes)
            != DialogButton::Yes)
        return;
    try {
        if (path.endsWith(QLatin1String(".txt"), Qt::CaseInsensitive)) {
            QSaveFile file(path);
            QByteArray text = toWindows1252(m_notiz1->toPlainText());
            text.replace("\n", "\r\n");
            if (!file.open(QIODevice::WriteOnly) || file.write(text) != text.size() || !file.commit())
                throw std::runtime_error(file.errorString().toStdString());
        } else {
            RtfText::saveFile(path, *m_notiz1->document());
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Tcontacteditform - Speichern"), &e);
    }
}

void ContactNoteEditor::printNote()
{
    const QString designation = m_designation ? m_designation() : QString();
    if (designation.isEmpty()) {
        dialogs().warning(QStringLiteral("Bitte geben Sie erst eine Kontaktbezeichnung ein."));
        return;
    }
    if (!notePrinter())
        return;
    const NotePrintResult result = notePrinter()(designation, RtfText::content(*m_notiz1));
    if (result.code != QLatin1String("OK"))
        reportError(QStringLiteral("Methode: NotizDruck\r\nError: ") + result.code + QStringLiteral("\r\n")
                    + QStringLiteral("Error-Number: ") + QString::number(result.number) + QStringLiteral("\r\n")
                    + result.message);
}

void ContactNoteEditor::setStyleBit(int bit, bool on)
{
    if (m_toolbarUpdating)
        return;
    QTextCharFormat f;
    switch (bit) {
    case 1: f.setFontWeight(on ? QFont::Bold : QFont::Normal); break;
    case 2: f.setFontItalic(on); break;
    case 4: f.setFontUnderline(on); break;
    case 8: f.setFontStrikeOut(on); break;
    default: return;
    }
    m_notiz1->mergeCurrentCharFormat(f);
}

void ContactNoteEditor::setAlignment(int tag)
{
    if (m_toolbarUpdating)
        return;
    m_notiz1->setAlignment(tag == 1 ? Qt::AlignRight : tag == 2 ? Qt::AlignHCenter : Qt::AlignLeft);
}

void ContactNoteEditor::setBullets(bool on)
{
    if (m_toolbarUpdating)
        return;
    QTextCursor c = m_notiz1->textCursor();
    if (on) {
        c.createList(QTextListFormat::ListDisc);
    } else if (QTextList* list = c.currentList()) {
        const QTextBlock block = c.block();
        list->remove(block);
        QTextBlockFormat bf = c.blockFormat();
        bf.setIndent(0);
        c.setBlockFormat(bf);
    }
}

void ContactNoteEditor::setFontName(const QString& name)
{
    if (m_toolbarUpdating)
        return;
    QTextCharFormat f;
    f.setFontFamilies({name});
    m_notiz1->mergeCurrentCharFormat(f);
}

void ContactNoteEditor::setFontSize(int size)
{
    if (m_toolbarUpdating || size <= 0)
        return;
    QTextCharFormat f;
    f.setFontPointSize(size);
    m_notiz1->mergeCurrentCharFormat(f);
}

void ContactNoteEditor::setFontColor(int index)
{
    if (m_toolbarUpdating || index < 0)
        return;
    QTextCharFormat f;
    f.setForeground(m_fontColor->itemData(index).value<QColor>());
    m_notiz1->mergeCurrentCharFormat(f);
}

void ContactNoteEditor::RichEditSelectionChange()
{
    if (!m_notiz1 || m_toolbarUpdating)
        return;
    m_toolbarUpdating = true;
    const QTextCharFormat f = m_notiz1->currentCharFormat();
    const QTextCursor c = m_notiz1->textCursor();
    m_style[0]->setChecked(f.fontWeight() >= QFont::Bold);
    m_style[1]->setChecked(f.fontItalic());
    m_style[2]->setChecked(f.fontUnderline());
    m_style[3]->setChecked(f.fontStrikeOut());
    m_bullets->setChecked(c.currentList() != nullptr);
    const double size = f.fontPointSize() > 0 ? f.fontPointSize() : m_notiz1->font().pointSizeF();
    m_fontSize->setValue(qRound(size));
    const QStringList families = f.fontFamilies().toStringList();
    m_fontName->setCurrentFont(QFont(families.isEmpty() ? m_notiz1->font().family() : families.first()));
    const QColor color = f.foreground().style() == Qt::NoBrush ? QColor(Qt::black) : f.foreground().color();
    m_fontColor->setCurrentIndex(m_fontColor->findData(color));
    const Qt::Alignment a = c.blockFormat().alignment() & Qt::AlignHorizontal_Mask;
    const int tag = (a & Qt::AlignRight) ? 1 : (a & Qt::AlignHCenter) ? 2 : 0;
    for (QAction* action : m_align->actions())
        action->setChecked(action->data().toInt() == tag);
    m_toolbarUpdating = false;
}

} // namespace orvanta

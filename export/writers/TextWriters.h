#pragma once
// The text formats: HTML, XML and comma-separated text, all UTF-8.

#include "export/writers/ExportWriter.h"

#include <QByteArray>
#include <QStringList>

namespace orvanta {

// Characters XML 1.0 cannot hold at all (control characters other than tab and line breaks,
// lone surrogates, U+FFFE/U+FFFF) become U+FFFD; the markup characters become entities.
[[nodiscard]] QByteArray escapeMarkup(const QString& text);
// An element name for a caption: characters a name cannot hold become "_", a name that would
// start with a digit, a dot, a hyphen or "xml" gets a "_" in front, an empty one is "Spalte<n>".
[[nodiscard]] QString xmlElementName(const QString& caption, int index);
// A field of comma-separated text, quoted when it holds a comma, a quote or a line break.
[[nodiscard]] QByteArray csvField(const QString& text);

class HtmlExportWriter final : public ExportWriter {
public:
    bool begin(QIODevice& out, const GridSnapshot& grid) override;
    bool groupRow(QIODevice& out, int level, const QString& text) override;
    bool dataRow(QIODevice& out, const GridSnapshot& grid) override;
    bool finish(QIODevice& out) override;

private:
    int m_columns = 0;
    QByteArray m_line;
};

class XmlExportWriter final : public ExportWriter {
public:
    bool begin(QIODevice& out, const GridSnapshot& grid) override;
    bool groupRow(QIODevice& out, int level, const QString& text) override;
    bool dataRow(QIODevice& out, const GridSnapshot& grid) override;
    bool finish(QIODevice& out) override;

private:
    std::vector<QByteArray> m_names;
    QByteArray m_line;
};

class TextExportWriter final : public ExportWriter {
public:
    bool begin(QIODevice& out, const GridSnapshot& grid) override;
    bool groupRow(QIODevice& out, int level, const QString& text) override;
    bool dataRow(QIODevice& out, const GridSnapshot& grid) override;
    bool finish(QIODevice& out) override;

private:
    int m_columns = 0;
    QByteArray m_line;
};

} // namespace orvanta

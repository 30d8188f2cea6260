#pragma once
// An INI file with the semantics of the Windows profile functions the monitor's files were
// written with: section and key names compare case-insensitively and the first occurrence of a
// duplicate wins; values are raw text (no quotes or escapes) trimmed of surrounding blanks;
// text is Windows-1252 (a UTF-8 byte-order mark is honoured); lines end in CR LF when written
// and in LF, CR LF or CR when read. Junk lines and NUL bytes are skipped, never fatal.
// Like WritePrivateProfileString, a loaded file keeps what the program does not touch: comments,
// blank lines, junk, hidden duplicates and the exact text of every line whose value is not
// changed are written back as they were read.

#include <QHash>
#include <QString>
#include <QStringList>
#include <vector>

namespace orvanta {

class IniFile final {
public:
    IniFile() = default;
    // Reads the file; a missing or unreadable file gives an empty INI (see isLoaded()).
    explicit IniFile(const QString& path);

    // Replaces the content with the file's. Returns false when the file could not be read.
    bool load(const QString& path);
    void parse(QByteArrayView bytes);
    [[nodiscard]] QByteArray serialize() const;
    // Writes the content to path() (or the given path) atomically. Returns success.
    [[nodiscard]] bool save() const;
    [[nodiscard]] bool saveAs(const QString& path);

    [[nodiscard]] const QString& path() const { return m_path; }
    void setPath(const QString& path) { m_path = path; }
    [[nodiscard]] bool isLoaded() const { return m_loaded; }

    [[nodiscard]] QStringList sections() const;
    [[nodiscard]] QStringList keys(const QString& section) const;
    [[nodiscard]] bool sectionExists(const QString& section) const;
    [[nodiscard]] bool valueExists(const QString& section, const QString& key) const;

    [[nodiscard]] QString readString(const QString& section, const QString& key, const QString& defaultValue = {}) const;
    // Decimal with optional sign, or hexadecimal as "0x..." / "$..."; anything else, and values
    // outside 32 bits, give the default.
    [[nodiscard]] int readInteger(const QString& section, const QString& key, int defaultValue) const;
    // An integer; non-zero is true. A value that is no integer gives the default.
    [[nodiscard]] bool readBool(const QString& section, const QString& key, bool defaultValue) const;
    // "." or "," as decimal separator; anything else gives the default.
    [[nodiscard]] double readFloat(const QString& section, const QString& key, double defaultValue) const;

    void writeString(const QString& section, const QString& key, const QString& value);
    void writeInteger(const QString& section, const QString& key, int value);
    void writeBool(const QString& section, const QString& key, bool value);
    void writeFloat(const QString& section, const QString& key, double value);
    void deleteKey(const QString& section, const QString& key);
    void eraseSection(const QString& section);
    void clear();

    // The integer rule of readInteger on a bare text, for the few callers that parse by hand.
    [[nodiscard]] static bool parseInteger(QStringView text, int& value);

private:
    struct Entry {
        QString key;
        QString value;
        QStringList lead; // lines kept verbatim before this one (comments, blanks, junk)
        QString line;     // the line as read; empty once the value is changed
    };
    struct Section {
        QString name;
        QString header;   // the header line as read; empty for a new section
        QStringList tail; // lines kept verbatim after the last entry
        std::vector<Entry> entries;
        QHash<QString, std::size_t> index; // folded key -> position in entries
    };

    [[nodiscard]] static QString fold(const QString& name);
    [[nodiscard]] const Section* findSection(const QString& name) const;
    [[nodiscard]] Section& sectionForWrite(const QString& name);
    [[nodiscard]] static const Entry* findEntry(const Section& section, const QString& key);
    static void addEntry(Section& section, const QString& key, const QString& value);

    QString m_path;
    bool m_loaded = false;
    bool m_utf8Bom = false;   // written back as it was read
    QStringList m_prelude;    // lines before the first section
    std::vector<Section> m_sections;
    QHash<QString, std::size_t> m_sectionIndex; // folded name -> position in m_sections
};

} // namespace orvanta

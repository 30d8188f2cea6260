#pragma once
// One country's area codes: codes (digits, no leading zeros as the lookup compares them) with
// their region names, in file order. Duplicates stay; the first equal entry wins at lookup.

#include <QByteArrayView>
#include <QString>
#include <QStringList>
#include <QStringView>

#include <cstdint>
#include <vector>

namespace orvanta {

class AreaCodeTable final {
public:
    // The index holds a slot for every digit string up to this length.
    static constexpr int kMaxPrefixLength = 6;

    // prefixLengths: the lengths tried at lookup (Germany 2..5, Austria 1..4, Switzerland 1..2);
    // lengths outside 1..kMaxPrefixLength are dropped.
    explicit AreaCodeTable(std::vector<int> prefixLengths);

    void clear();
    // Appends one entry. Codes longer than the longest prefix length or not made of digits stay in
    // the list but can never match, so they are not indexed.
    void append(const QString& code, const QString& name);
    // Appends the entries of an area-code file's contents (Windows-1252, CR LF or LF): per line
    // the leading digits before the first comma, and everything after that comma as the name.
    void appendFileContents(QByteArrayView contents);

    // Splits a dialled number into the area code as dialled (leading zeros kept), the local
    // number and the region; the longest listed prefix wins. False only when the table is empty.
    // Without a known prefix: true, empty prefix and region, rest = the unchanged number.
    bool lookup(QStringView number, QString& prefix, QString& rest, QString& region) const;

    [[nodiscard]] bool isEmpty() const { return m_codes.isEmpty(); }
    [[nodiscard]] qsizetype size() const { return m_codes.size(); }
    [[nodiscard]] const QStringList& codes() const { return m_codes; }
    [[nodiscard]] const QStringList& names() const { return m_names; }
    [[nodiscard]] const std::vector<int>& prefixLengths() const { return m_prefixLengths; }

private:
    // Slot of a digit run of the given length (1..m_maxLength) in m_index.
    [[nodiscard]] std::size_t slot(const char16_t* digits, int length) const;

    std::vector<int> m_prefixLengths;
    int m_maxLength = 0;
    std::vector<std::size_t> m_offsets; // m_offsets[L]: first slot of the codes of length L
    // Every digit string of length 1..m_maxLength has its own slot holding the index of the first
    // equal entry, or -1: one array read per tried prefix, however long the list.
    std::vector<std::int32_t> m_index;
    QStringList m_codes;
    QStringList m_names;
};

} // namespace orvanta

#pragma once
// The in-memory copy of one contact while it is open for editing: the contact's columns, its
// telephone and e-mail entries with their change states, and the note. Saving (done by the main
// window) sends only what the states say.

#include "phone/TvkKommItem.h"

#include <QByteArray>
#include <QString>
#include <QStringList>

#include <array>
#include <cstdint>

namespace orvanta {

class TvkMiniKontakt final {
public:
    // The contact's text columns with their widths.
    enum class Field {
        ANREDE,
        VNAME,
        NAME,
        FIRMA,
        TITEL,
        CONTBEZ,
        WEBSITE,
        ABTEILUNG,
        STR,
        PLZ,
        ORT,
        ZUSATZ,
        LAND,
        BUNDESLAND,
        KATBEZ,
    };
    static constexpr int FieldCount = 15;
    [[nodiscard]] static int width(Field field);

    TvkMiniKontakt() = default;

    [[nodiscard]] std::int32_t LID() const { return m_lid; }
    void setLID(std::int32_t lid) { m_lid = lid; }

    [[nodiscard]] const QString& value(Field field) const { return m_fields[index(field)]; }
    // Stores the value cut to the field's width; an equal value changes nothing.
    void setValue(Field field, const QString& value);

#define ORVANTA_CONTACT_FIELD(Name)                                                                \
    [[nodiscard]] const QString& Name() const { return value(Field::Name); }                       \
    void set##Name(const QString& v) { setValue(Field::Name, v); }
    ORVANTA_CONTACT_FIELD(ANREDE)
    ORVANTA_CONTACT_FIELD(VNAME)
    ORVANTA_CONTACT_FIELD(NAME)
    ORVANTA_CONTACT_FIELD(FIRMA)
    ORVANTA_CONTACT_FIELD(TITEL)
    ORVANTA_CONTACT_FIELD(CONTBEZ)
    ORVANTA_CONTACT_FIELD(WEBSITE)
    ORVANTA_CONTACT_FIELD(ABTEILUNG)
    ORVANTA_CONTACT_FIELD(STR)
    ORVANTA_CONTACT_FIELD(PLZ)
    ORVANTA_CONTACT_FIELD(ORT)
    ORVANTA_CONTACT_FIELD(ZUSATZ)
    ORVANTA_CONTACT_FIELD(LAND)
    ORVANTA_CONTACT_FIELD(BUNDESLAND)
    ORVANTA_CONTACT_FIELD(KATBEZ)
#undef ORVANTA_CONTACT_FIELD

    // Telephone entries. AddKD appends a copy cut to the widths, with the digit forms derived from
    // LC, VORW and NUMBER, and returns its index (-1 on failure). EditKD takes the item's texts
    // and AUTOREJECT (not LID, CID, status) and marks an unchanged entry changed; DeleteKD marks
    // the entry deleted. Both report an index outside the list and return false.
    [[nodiscard]] const TvkKommArray& KD() const { return m_kd; }
    int AddKD(const TvkKommItem& item);
    bool EditKD(const TvkKommItem& item, int index);
    bool DeleteKD(int index);
    void ClearKD();

    [[nodiscard]] const TvkMailArray& Mail() const { return m_mail; }
    int AddMail(const TvkMailItem& item);
    bool EditMail(const TvkMailItem& item, int index);
    bool DeleteMail(int index);
    void ClearMail();

    // After saving: the entry was sent. False for an index outside the list.
    bool setKDStatus(int index, EntryStatus status);
    bool setMailStatus(int index, EntryStatus status);

    // The NOTIZ blob. StoreNotes empties it and, when text is not empty, stores the lines, each
    // followed by CR LF, in the Windows code page; the byte form stores the content as it is.
    [[nodiscard]] const QByteArray& notes() const { return m_notes; }
    void StoreNotes(const QStringList& lines, const QString& text);
    void StoreNotes(const QByteArray& content, const QString& text);

private:
    [[nodiscard]] static std::size_t index(Field field) { return static_cast<std::size_t>(field); }
    static void fillNumbers(TvkKommItem& target, const TvkKommItem& source);

    std::int32_t m_lid = 0;
    std::array<QString, FieldCount> m_fields;
    TvkKommArray m_kd;
    TvkMailArray m_mail;
    QByteArray m_notes;
};

} // namespace orvanta

#pragma once
// The call monitor's settings as this program sees them: the "MoniOptions" section of the
// monitor's settings file, its MSN list and whether the monitor starts with the session. The
// object only reads; the one writer of the MSN list file is writeMsnFile() below, used by the
// monitor's own set-up and the settings program, never by the main program.

#include <QByteArray>
#include <QList>
#include <QString>

#include <cstdint>

namespace orvanta {

// One subscriber number of the monitor's MSN list file with its designation.
struct MsnRecord {
    QString MSN;         // at most 20 characters
    QString Bezeichnung; // at most 30 characters

    friend bool operator==(const MsnRecord&, const MsnRecord&) = default;
};

// The MSN list file for a list: one 52-byte record per number, the texts in Windows-1252 and cut
// to 20 and 30 characters.
[[nodiscard]] QByteArray encodeMsnFile(const QList<MsnRecord>& msns);
// Writes the file atomically (the old list stays whole when writing fails). Returns success.
[[nodiscard]] bool writeMsnFile(const QString& path, const QList<MsnRecord>& msns);

class TRufwarteIni final {
public:
    // The bare names the monitor uses in the program folder.
    static constexpr const char* kSettingsFile = "ISDNStore";
    static constexpr const char* kSection = "MoniOptions";
    static constexpr const char* kMsnFile = "msns";
    static constexpr const char* kColorFile = "OScheme";
    static constexpr const char* kApplicationName = "rufwarte.exe";
    // Size of one record of the MSN list file: a length byte and 20 characters, a length byte
    // and 30 characters.
    static constexpr int kMsnRecordSize = 52;

    TRufwarteIni() = default;
    TRufwarteIni(const TRufwarteIni&) = delete;
    TRufwarteIni& operator=(const TRufwarteIni&) = delete;

    // Stores the names; the MSN and colour files live in the settings file's folder. Then reads
    // the MSN list.
    void SetFileNames(const QString& settingsFile, const QString& section, const QString& msnFileName,
        const QString& applicationName);
    // SetFileNames with the monitor's files in the program folder.
    void SetProgramFolderFiles();

    // Reads every key (missing keys give their defaults; guarded keys may refuse a value and
    // keep the one they hold). False, after an error dialog, when the file is not defined, not
    // found or cannot be read; the values then stay as they were.
    bool ReadFromIni();
    // Whether the monitor is started with the user's session (its XDG autostart entry exists).
    bool IsAppInRun();
    // Re-reads the MSN list; a trailing partial record is ignored, a missing file gives an
    // empty list.
    void ReadMSNSFromFile();

    [[nodiscard]] const QString& settingsFile() const { return m_settingsFile; }
    [[nodiscard]] const QString& section() const { return m_section; }
    [[nodiscard]] const QString& msnFile() const { return m_msnFile; }
    [[nodiscard]] const QString& colorFile() const { return m_colorFile; }
    [[nodiscard]] const QString& applicationName() const { return m_applicationName; }
    [[nodiscard]] bool AutoStart() const { return m_autoStart; }
    [[nodiscard]] const QList<MsnRecord>& MSNs() const { return m_msns; }

    [[nodiscard]] bool INCOMING_MSN_ONLY() const { return m_incomingMsnOnly; }
    [[nodiscard]] bool REJECT_WITHOUT_MSN() const { return m_rejectWithoutMsn; }
    [[nodiscard]] const QString& SOUND() const { return m_sound; }
    [[nodiscard]] bool SOUNDLOOP() const { return m_soundLoop; }
    [[nodiscard]] bool PS() const { return m_ps; }
    [[nodiscard]] std::int32_t CLOSE_WND() const { return m_closeWnd; }
    [[nodiscard]] std::int32_t CLOSE_WND_CONTACT() const { return m_closeWndContact; }
    [[nodiscard]] bool IWND() const { return m_iwnd; }
    [[nodiscard]] bool CIWNDA() const { return m_ciwnda; }
    [[nodiscard]] std::int32_t WND_POS() const { return m_wndPos; }
    [[nodiscard]] bool OUT_SCSA() const { return m_outScsa; }
    [[nodiscard]] bool VB() const { return m_vb; }
    [[nodiscard]] std::int32_t VB_AA() const { return m_vbAa; }
    [[nodiscard]] const QString& VB_Voice() const { return m_vbVoice; }
    [[nodiscard]] bool NSA() const { return m_nsa; }
    // 0 for a value outside 0..9.
    [[nodiscard]] std::int32_t AMT() const { return m_amt >= 0 && m_amt <= 9 ? m_amt : 0; }
    // 2 for a value outside 1..5.
    [[nodiscard]] std::int32_t MNSAL() const { return m_mnsal >= 1 && m_mnsal <= 5 ? m_mnsal : 2; }
    // A currency amount with four decimal places.
    [[nodiscard]] double GEB() const { return static_cast<double>(m_geb) / 10000.0; }
    // The same in ten-thousandths.
    [[nodiscard]] std::int64_t GEBCurrency() const { return m_geb; }
    [[nodiscard]] const QString& CBC() const { return m_cbc; }
    [[nodiscard]] bool CLIR() const { return m_clir; }
    [[nodiscard]] const QString& SMSN() const { return m_smsn; }
    // The country of the lookups: 1 Germany, 2 Austria, 3 Switzerland.
    [[nodiscard]] std::uint8_t AC() const { return m_ac; }
    [[nodiscard]] std::uint8_t DBL() const { return m_dbl; }
    [[nodiscard]] std::uint8_t TCPSSTATE() const { return m_tcpsState; }
    [[nodiscard]] std::uint8_t TCPIPBIND() const { return m_tcpipBind; }
    [[nodiscard]] const QString& TCPIP() const { return m_tcpip; }
    [[nodiscard]] std::int32_t TCPPORT() const { return m_tcpPort; }
    [[nodiscard]] std::uint8_t TCPMSNSTATE() const { return m_tcpMsnState; }
    [[nodiscard]] const QString& TCPMSNS() const { return m_tcpMsns; }
    [[nodiscard]] bool TCPLOG() const { return m_tcpLog; }
    [[nodiscard]] bool CAPILOG() const { return m_capiLog; }
    [[nodiscard]] std::int32_t RA() const { return m_ra; }

private:
    void setSOUND(const QString& value);
    void setVB_Voice(const QString& value);
    void setAMT(std::int32_t value);
    void setMNSAL(std::int32_t value);
    void setCBC(const QString& value);

    QString m_settingsFile;
    QString m_section;
    QString m_msnFile;
    QString m_colorFile;
    QString m_applicationName;
    bool m_autoStart = false;
    QList<MsnRecord> m_msns;

    bool m_incomingMsnOnly = false;
    bool m_rejectWithoutMsn = false;
    QString m_sound;
    bool m_soundLoop = false;
    bool m_ps = false;
    std::int32_t m_closeWnd = 5;
    std::int32_t m_closeWndContact = 5;
    bool m_iwnd = true;
    bool m_ciwnda = true;
    std::int32_t m_wndPos = 3;
    bool m_outScsa = true;
    bool m_vb = false;
    std::int32_t m_vbAa = 60;
    QString m_vbVoice;
    bool m_nsa = false;
    std::int32_t m_amt = 0;
    std::int32_t m_mnsal = 0;
    std::int64_t m_geb = 0;
    QString m_cbc;
    bool m_clir = false;
    QString m_smsn;
    std::uint8_t m_ac = 1;
    std::uint8_t m_dbl = 4;
    std::uint8_t m_tcpsState = 0;
    std::uint8_t m_tcpipBind = 0;
    QString m_tcpip;
    std::int32_t m_tcpPort = 9090;
    std::uint8_t m_tcpMsnState = 0;
    QString m_tcpMsns;
    bool m_tcpLog = false;
    bool m_capiLog = false;
    std::int32_t m_ra = 16;
};

} // namespace orvanta

#include "platform/RufwarteIni.h"

#include "platform/AppException.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/Registry.h"
#include "platform/Windows1252.h"

#include <QFile>
#include <QFileInfo>
#include <QSaveFile>

#include <cmath>

namespace orvanta {

namespace {

// The monitor's settings report their failures straight to the user, not through the error log.
void showFailure(const char* operation, const std::exception& e)
{
    dialogs().error(QStringLiteral("# _RufwarteIniValues - ") + QLatin1String(operation) + QStringLiteral("\r\n")
        + exceptionLine(e));
}

// The folder part of a path with its trailing separator, empty for a bare name.
QString folderOf(const QString& path)
{
    const qsizetype slash = path.lastIndexOf(u'/');
    return slash < 0 ? QString() : path.left(slash + 1);
}

bool isExistingFile(const QString& path)
{
    return !path.isEmpty() && QFileInfo(path).isFile();
}

std::uint8_t lowByte(int value)
{
    return static_cast<std::uint8_t>(static_cast<unsigned>(value) & 0xFFu);
}

// A currency holds ten-thousandths in 64 bits; an amount it cannot hold reads as no amount.
std::int64_t toCurrency(double value)
{
    const double scaled = std::nearbyint(value * 10000.0);
    if (!std::isfinite(scaled) || std::fabs(scaled) >= 9.2e18)
        return 0;
    return static_cast<std::int64_t>(scaled);
}

QString shortString(const char* record, int capacity)
{
    const int length = std::min<int>(static_cast<unsigned char>(record[0]), capacity);
    return fromWindows1252(QByteArrayView(record + 1, length));
}

void putShortString(QByteArray& record, int at, const QString& text, int capacity)
{
    const QByteArray bytes = toWindows1252(text).left(capacity);
    record[at] = static_cast<char>(bytes.size());
    std::copy(bytes.begin(), bytes.end(), record.begin() + at + 1);
}

} // namespace

QByteArray encodeMsnFile(const QList<MsnRecord>& msns)
{
    QByteArray bytes;
    bytes.reserve(msns.size() * TRufwarteIni::kMsnRecordSize);
    for (const MsnRecord& msn : msns) {
        QByteArray record(TRufwarteIni::kMsnRecordSize, '\0');
        putShortString(record, 0, msn.MSN, 20);
        putShortString(record, 21, msn.Bezeichnung, 30);
        bytes += record;
    }
    return bytes;
}

bool writeMsnFile(const QString& path, const QList<MsnRecord>& msns)
{
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        return false;
    const QByteArray bytes = encodeMsnFile(msns);
    if (file.write(bytes) != bytes.size()) {
        file.cancelWriting();
        return false;
    }
    return file.commit();
}

void TRufwarteIni::SetFileNames(const QString& settingsFile, const QString& section, const QString& msnFileName,
    const QString& applicationName)
{
    m_settingsFile = settingsFile;
    m_section = section;
    m_applicationName = applicationName;
    const QString folder = folderOf(settingsFile);
    m_colorFile = folder + QLatin1String(kColorFile);
    m_msnFile = msnFileName.isEmpty() ? QString() : folder + msnFileName;
    ReadMSNSFromFile();
}

void TRufwarteIni::SetProgramFolderFiles()
{
    SetFileNames(programFile(QLatin1String(kSettingsFile)), QLatin1String(kSection), QLatin1String(kMsnFile),
        QLatin1String(kApplicationName));
}

bool TRufwarteIni::ReadFromIni()
{
    if (m_settingsFile.isEmpty() || m_section.isEmpty()) {
        dialogs().error(QStringLiteral("INI-Datei nicht definiert oder Sektion ungültig."));
        return false;
    }
    if (!isExistingFile(m_settingsFile)) {
        dialogs().error(QStringLiteral("INI-Datei konnte nicht gefunden werden."));
        return false;
    }
    try {
        IniFile ini;
        if (!ini.load(m_settingsFile))
            throw AppException(QStringLiteral("Die Datei \"%1\" kann nicht gelesen werden.").arg(m_settingsFile));
        m_autoStart = IsAppInRun();

        const QString& s = m_section;
        const auto flag = [&](const char* key, bool def) { return ini.readBool(s, QLatin1String(key), def); };
        const auto number = [&](const char* key, int def) { return ini.readInteger(s, QLatin1String(key), def); };
        const auto text = [&](const char* key) { return ini.readString(s, QLatin1String(key), QString()); };

        m_incomingMsnOnly = flag("INCOMING_MSN_ONLY", false);
        m_rejectWithoutMsn = flag("REJECT_WITHOUT_MSN", false);
        setSOUND(text("SOUND"));
        m_soundLoop = flag("SOUNDLOOP", false);
        m_ps = flag("PS", false);
        m_closeWnd = number("CLOSE_WND", 10);
        m_closeWndContact = number("CLOSE_WND_CONTACT", 10);
        m_iwnd = flag("IWND", true);
        m_ciwnda = flag("CIWNDA", true);
        m_wndPos = number("WND_POS", 3);
        m_outScsa = flag("OUT_SCSA", false);
        m_vb = flag("VB", false);
        m_vbAa = number("VB_AA", 60);
        setVB_Voice(text("VB_Voice"));
        m_nsa = flag("NSA", false);
        setAMT(number("AMT", 0));
        setMNSAL(number("MNSAL", 2));
        m_geb = toCurrency(ini.readFloat(s, QStringLiteral("GEB"), 0.0));
        setCBC(text("CBC"));
        m_clir = flag("CLIR", false);
        m_smsn = text("SMSN");
        m_ac = lowByte(number("AC", 0));
        m_dbl = lowByte(number("DBL", 4));
        m_tcpsState = lowByte(number("TCPSSTATE", 0));
        m_tcpipBind = lowByte(number("TCPIPBIND", 0));
        m_tcpip = text("TCPIP");
        m_tcpPort = number("TCPPORT", 9090);
        m_tcpMsnState = lowByte(number("TCPMSNSTATE", 0));
        m_tcpMsns = text("TCPMSNS");
        m_tcpLog = flag("TCPLOG", false);
        m_capiLog = flag("CAPILOG", false);
        m_ra = number("RA", 16);
        return true;
    } catch (const std::exception& e) {
        showFailure("ReadFromIni", e);
        return false;
    }
}

bool TRufwarteIni::IsAppInRun()
{
    try {
        return autostartEntryExists(m_applicationName);
    } catch (const std::exception& e) {
        showFailure("IsAppInRun", e);
        return false;
    }
}

void TRufwarteIni::ReadMSNSFromFile()
{
    try {
        // The list mirrors the file: a file that is gone leaves no stale numbers behind.
        m_msns.clear();
        if (!isExistingFile(m_msnFile))
            return;
        QFile file(m_msnFile);
        if (!file.open(QIODevice::ReadOnly))
            throw AppException(QStringLiteral("Die Datei \"%1\" kann nicht geöffnet werden.").arg(m_msnFile));
        char record[kMsnRecordSize];
        while (file.read(record, kMsnRecordSize) == kMsnRecordSize)
            m_msns.append(MsnRecord{shortString(record, 20), shortString(record + 21, 30)});
        if (file.error() != QFileDevice::NoError)
            throw AppException(QStringLiteral("Fehler beim Lesen der Datei \"%1\".").arg(m_msnFile));
    } catch (const std::exception& e) {
        showFailure("ReadMSNSFromFile", e);
    }
}

void TRufwarteIni::setSOUND(const QString& value)
{
    if (value != m_sound && isExistingFile(value))
        m_sound = value;
}

void TRufwarteIni::setVB_Voice(const QString& value)
{
    // The monitor plays only ".wav" files and compares the ending exactly.
    if (value != m_vbVoice && isExistingFile(value) && value.endsWith(QLatin1String(".wav"), Qt::CaseSensitive))
        m_vbVoice = value;
}

void TRufwarteIni::setAMT(std::int32_t value)
{
    if (value >= 0 && value < 10)
        m_amt = value;
}

void TRufwarteIni::setMNSAL(std::int32_t value)
{
    if (value >= 1 && value < 5)
        m_mnsal = value;
}

void TRufwarteIni::setCBC(const QString& value)
{
    m_cbc = value.left(10);
}

} // namespace orvanta

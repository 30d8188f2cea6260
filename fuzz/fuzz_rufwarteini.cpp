// The monitor's settings file and MSN list file of any content and length, read the way the
// program reads them at start-up. Input: two bytes giving the MSN file's share, the MSN file,
// then the settings file.

#include "platform/RufwarteIni.h"
#include "platform/DialogService.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <cstddef>
#include <cstdint>
#include <cstdlib>

using namespace orvanta;

namespace {

class SilentDialogs final : public DialogService {
public:
    DialogButton show(DialogKind, const QString&, const QString&, DialogButtons, DialogButton) override
    {
        return DialogButton::Ok;
    }
};

void writeFile(const QString& path, QByteArrayView bytes)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        std::abort();
    file.write(bytes.data(), bytes.size());
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static QTemporaryDir dir;
    static SilentDialogs silent;
    static const bool ready = [] {
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(dir.path()));
        setDialogService(&silent);
        return dir.isValid();
    }();
    if (!ready)
        std::abort();

    const QByteArrayView input(reinterpret_cast<const char*>(data), static_cast<qsizetype>(size));
    if (input.size() < 2)
        return 0;
    const auto body = input.sliced(2);
    const qsizetype msnSize = (static_cast<unsigned char>(input[0]) | static_cast<unsigned char>(input[1]) << 8)
        % (body.size() + 1);
    writeFile(dir.filePath(QStringLiteral("msns")), body.first(msnSize));
    writeFile(dir.filePath(QStringLiteral("ISDNStore")), body.sliced(msnSize));

    TRufwarteIni settings;
    settings.SetFileNames(dir.filePath(QStringLiteral("ISDNStore")), QStringLiteral("MoniOptions"),
        QStringLiteral("msns"), QStringLiteral("rufwarte.exe"));
    if (settings.MSNs().size() != msnSize / TRufwarteIni::kMsnRecordSize)
        std::abort();
    for (const MsnRecord& record : settings.MSNs()) {
        if (record.MSN.size() > 20 || record.Bezeichnung.size() > 30)
            std::abort();
    }
    if (!settings.ReadFromIni())
        std::abort();
    if (settings.CBC().size() > 10 || settings.AMT() < 0 || settings.AMT() > 9 || settings.MNSAL() < 1
        || settings.MNSAL() > 5)
        std::abort();
    return 0;
}

#pragma once
// The information window of "? › Info": program name, version, licence, the program folder, the
// database the program opens, and the versions of Qt and of the Firebird client library.

#include <QDialog>

namespace orvanta::about {

class AboutDialog final : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(AboutDialog)

public:
    explicit AboutDialog(QWidget* parent = nullptr);
    ~AboutDialog() override;
};

} // namespace orvanta::about

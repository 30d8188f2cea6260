#pragma once
// The print dialog of the preview: all pages, the current page or a range, and copies, sent to
// the print target (the system's default printer; tests print to a PDF file).

#include <QDialog>

#include <functional>
#include <memory>

class QLineEdit;
class QPagedPaintDevice;
class QPushButton;
class QRadioButton;

namespace orvanta {

class TRavePreviewF;

struct PrintTarget {
    std::function<bool()> available; // whether any printer is installed
    std::function<std::unique_ptr<QPagedPaintDevice>()> open; // where the pages of one job go
};
[[nodiscard]] const PrintTarget& printTarget();
// An empty target restores the system's printers.
void setPrintTarget(PrintTarget target);

class TPrintF final : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TPrintF)

public:
    explicit TPrintF(TRavePreviewF* preview);
    ~TPrintF() override;

    // "Drucken": the pages chosen, as many times as the copies say, then the dialog closes.
    void AdvTB1Click();
    // The pages "Drucken" prints (1-based, inclusive) after normalising the edits.
    [[nodiscard]] std::pair<int, int> pageRange();

private:
    void cxRB1Click();

    TRavePreviewF* m_preview;
    QRadioButton* m_all;
    QRadioButton* m_current;
    QRadioButton* m_range;
    QLineEdit* m_from;
    QLineEdit* m_to;
    QLineEdit* m_copies;
};

} // namespace orvanta

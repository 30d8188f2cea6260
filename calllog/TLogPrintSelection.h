#pragma once
// "Protokollausgabe": which calls the call-log report prints (all, one day or a period), simple
// or detailed, and grouped by what.

#include <QDate>
#include <QDialog>

class QComboBox;
class QDateEdit;
class QLabel;
class QRadioButton;

namespace orvanta {

class TDM2;

class TLogPrintSelection final : public QDialog {
    Q_OBJECT
    Q_DISABLE_COPY_MOVE(TLogPrintSelection)

public:
    explicit TLogPrintSelection(TDM2* dm, QWidget* parent = nullptr);
    ~TLogPrintSelection() override;

    // Start and end (invalid = no date) and the variant from the controls.
    bool PrintPrepare();
    // "Ausgeben": the report into the preview, a failure into the error log, then closes.
    void AdvTB1Click();

    [[nodiscard]] QDate startDate() const { return m_start; }
    [[nodiscard]] QDate endDate() const { return m_end; }
    [[nodiscard]] int variant() const { return m_variant; }

    // The period a preset of "CB1" stands for, counted from today (weeks from Monday).
    [[nodiscard]] static std::pair<QDate, QDate> presetPeriod(int preset, QDate today);

private:
    void rb1Click(QRadioButton* sender);
    void CB1Change(int index);

    TDM2* m_dm;
    QDate m_start;
    QDate m_end;
    int m_variant = 0;
    bool m_settingPreset = false;
    QRadioButton* m_rb[11] = {};
    QDateEdit* m_de1 = nullptr;
    QDateEdit* m_de2 = nullptr;
    QDateEdit* m_de3 = nullptr;
    QLabel* m_l2 = nullptr;
    QComboBox* m_cb1 = nullptr;
};

} // namespace orvanta

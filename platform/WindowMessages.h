#pragma once
// The window messages of the program and of the monitor, and the event that carries one inside
// the program: a message number with its wParam and lParam. Windows post and send them to each
// other through postMessage()/sendMessage(); a receiver handles WindowMessageEvent in its
// customEvent() (or event()) and may set a result for a sent message.

#include <QEvent>
#include <QPointer>

namespace orvanta {

inline constexpr int WM_USER = 0x0400;

// Between the program's windows; all are handled by the main window.
inline constexpr int WMCLOSECONTACTFORM = WM_USER + 802;
inline constexpr int WMSAVECONDATA = WM_USER + 803;
inline constexpr int WMLOGINFOCHANGE = WM_USER + 805;
inline constexpr int WMEXPORTGAUGE = WM_USER + 806;
inline constexpr int WMSTATUSPANEL = WM_USER + 807;
// lParam of WMSTATUSPANEL beside 0 (log entries) and 1 (contacts): the log entries so far while
// the log is still being read, and those that arrived before reading it failed.
inline constexpr int kStatusLogLoading = 2;
inline constexpr int kStatusLogIncomplete = 3;
inline constexpr int WMNEWCONTACT = WM_USER + 808;
inline constexpr int WMOPENCONTACT = WM_USER + 809;
inline constexpr int WMDELETECONTACT = WM_USER + 810;
inline constexpr int WMSEARCHUNCHECKED = WM_USER + 812;
inline constexpr int WMCONTACTDATAFROMSCREEN = WM_USER + 813;
inline constexpr int WMCHANGELOGFILTERANDGROUPBUTTONS = WM_USER + 814;
inline constexpr int WMLOGOPENBEMERKUNG = WM_USER + 815;
inline constexpr int WMCLOSELOGDETAILFORM = WM_USER + 816;
inline constexpr int WMDELETELOGITEM = WM_USER + 817;
inline constexpr int WMOPENCONTACTPERLOG = WM_USER + 818;
inline constexpr int WMPLAYVOICEBOXITEM = WM_USER + 819;
inline constexpr int WMUPDATEVOICEBOXGRID = WM_USER + 820;
// A second start of the program asks the running one to bring its main window to the front.
inline constexpr int WMBRINGTOFRONT = WM_USER + 830;

// From the monitor to the program, taken off the message loop before any window sees them.
inline constexpr int WMMONITOR_LOGCHANGED_SEND = WM_USER + 705;   // 1729: send WMLOGINFOCHANGE
inline constexpr int WMMONITOR_LOGCHANGED_POST = WM_USER + 709;   // 1733: post WMLOGINFOCHANGE
inline constexpr int WMMONITOR_IGNORED = WM_USER + 712;           // 1736: swallowed
inline constexpr int WMMONITOR_CONTACTFROMLOG = WM_USER + 720;    // 1744: post WMCONTACTDATAFROMSCREEN

// From the program to the monitor's application window.
inline constexpr int WMMONITOR_QUIT = WM_USER + 711;        // 1735
inline constexpr int WMMONITOR_PAUSERESUME = WM_USER + 716; // 1740

class WindowMessageEvent final : public QEvent {
public:
    WindowMessageEvent(int message, qintptr wParam = 0, qintptr lParam = 0);

    // The one registered event type of every window message.
    [[nodiscard]] static QEvent::Type eventType();

    [[nodiscard]] int message() const { return m_message; }
    [[nodiscard]] qintptr wParam() const { return m_wParam; }
    [[nodiscard]] qintptr lParam() const { return m_lParam; }
    // What sendMessage() returns; 0 unless the receiver sets it.
    void setResult(qintptr result) { m_result = result; }
    [[nodiscard]] qintptr result() const { return m_result; }

private:
    int m_message;
    qintptr m_wParam;
    qintptr m_lParam;
    qintptr m_result = 0;
};

// The event as a window message, or nullptr for any other event.
[[nodiscard]] WindowMessageEvent* asWindowMessage(QEvent* event);

// Queues the message for the receiver's thread; a null receiver is ignored.
void postMessage(QObject* receiver, int message, qintptr wParam = 0, qintptr lParam = 0);
// Delivers the message at once and returns the result the receiver set (0 for a null receiver).
qintptr sendMessage(QObject* receiver, int message, qintptr wParam = 0, qintptr lParam = 0);

} // namespace orvanta

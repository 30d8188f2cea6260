#pragma once
// The hourglass while something takes a while. A failure report resets the cursor to the
// default whatever is still stacked, so the user never faces an error under an hourglass.

namespace orvanta {

class BusyCursor final {
public:
    BusyCursor();
    ~BusyCursor();
    BusyCursor(const BusyCursor&) = delete;
    BusyCursor& operator=(const BusyCursor&) = delete;

    // Shows the hourglass until resetCursor(), for the cases without a scope to bind it to.
    static void setHourglass();
    // Back to the default cursor: every hourglass set so far is removed.
    static void resetCursor();
    [[nodiscard]] static bool isBusy();

private:
    unsigned m_generation;
};

} // namespace orvanta

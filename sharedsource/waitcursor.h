#pragma once

// The wait cursor for the length of a server call. Nested guards stack;
// without a GUI application there is no cursor to change.

namespace sharedsource {

void BeginWaitCursor();
void EndWaitCursor();

class CWaitCursor final
{
public:
    CWaitCursor() { BeginWaitCursor(); }
    CWaitCursor(const CWaitCursor &) = delete;
    CWaitCursor &operator=(const CWaitCursor &) = delete;
    ~CWaitCursor() { Restore(); }

    // Ends the wait early; the destructor then does nothing.
    void Restore()
    {
        if (m_active)
            EndWaitCursor();
        m_active = false;
    }

private:
    bool m_active = true;
};

} // namespace sharedsource

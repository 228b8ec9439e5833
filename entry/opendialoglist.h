#pragma once

// The module's list of open modeless windows, which the last Cleanup closes.
// It does not own the windows. Changed on the user-interface thread only.

#include "sorvik/serverdialogs.h"

#include <cstddef>
#include <list>

namespace cv::vek::rovo {

class OpenDialogList final
{
public:
    using Position = std::list<INonModalDialog *>::iterator;

    // Puts dialog first and stores its entry in position; nothing happens
    // when either is null.
    void Register(INonModalDialog *dialog, Position *position);
    void Unregister(Position position);

    // Asks every window to close, the most recently registered first.
    // Closing usually unregisters the window (and may unregister others);
    // windows registered meanwhile are not asked.
    void CloseAll();

    std::size_t Count() const;

private:
    std::list<INonModalDialog *> m_dialogs;
    // While CloseAll walks the list, unregistered entries are only emptied,
    // so no position the walk holds goes stale.
    bool m_walking = false;
};

OpenDialogList &OpenDialogs();

} // namespace cv::vek::rovo

#pragma once

// The module's list of open modeless windows, which the last Cleanup closes.
// It does not own the windows. Changed on the user-interface thread only.
// Windows register through an OpenDialogEntry for as long as they exist.

#include "sorvik/serverdialogs.h"

#include <cstddef>
#include <list>

namespace sharedsource {

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

// A window's place in the open-dialog list from its construction to its destruction.
class OpenDialogEntry final
{
public:
    explicit OpenDialogEntry(INonModalDialog &dialog, OpenDialogList &list = OpenDialogs());
    OpenDialogEntry(const OpenDialogEntry &) = delete;
    OpenDialogEntry &operator=(const OpenDialogEntry &) = delete;
    ~OpenDialogEntry();

private:
    OpenDialogList &m_list;
    OpenDialogList::Position m_position;
};

} // namespace sharedsource

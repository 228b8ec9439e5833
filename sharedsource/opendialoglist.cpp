#include "sharedsource/opendialoglist.h"

#include <algorithm>

namespace sharedsource {

void OpenDialogList::Register(INonModalDialog *dialog, Position *position)
{
    if (!dialog || !position)
        return;
    m_dialogs.push_front(dialog);
    *position = m_dialogs.begin();
}

void OpenDialogList::Unregister(Position position)
{
    if (m_walking)
        *position = nullptr;
    else
        m_dialogs.erase(position);
}

void OpenDialogList::CloseAll()
{
    if (m_walking)
        return;
    struct Walk
    {
        OpenDialogList &list;
        explicit Walk(OpenDialogList &l) : list(l) { list.m_walking = true; }
        ~Walk()
        {
            list.m_walking = false;
            list.m_dialogs.remove(nullptr);
        }
    } walk(*this);
    // Entries registered during the walk go in front of it, so the end is fixed.
    for (auto it = m_dialogs.begin(); it != m_dialogs.end(); ++it) {
        if (INonModalDialog *dialog = *it)
            dialog->Close();
    }
}

std::size_t OpenDialogList::Count() const
{
    return std::size_t(std::count_if(m_dialogs.begin(), m_dialogs.end(), [](auto *dialog) { return dialog; }));
}

OpenDialogList &OpenDialogs()
{
    static OpenDialogList list;
    return list;
}

OpenDialogEntry::OpenDialogEntry(INonModalDialog &dialog, OpenDialogList &list) : m_list(list)
{
    m_list.Register(&dialog, &m_position);
}

OpenDialogEntry::~OpenDialogEntry()
{
    m_list.Unregister(m_position);
}

} // namespace sharedsource

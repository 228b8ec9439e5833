// The module's list of open modeless windows: newest first, and safe
// against windows that remove entries while the list closes them.

#include "sharedsource/opendialoglist.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

namespace {

using sharedsource::OpenDialogList;
using Names = std::vector<std::string>;

// A modeless window that unregisters itself, and if told another one, when it closes.
class Window final : public INonModalDialog
{
public:
    Window(OpenDialogList &list, Names &closed, std::string name) : m_list(list), m_closed(closed), m_name(name)
    {
        m_list.Register(this, &m_position);
    }
    ~Window() { Unregister(); }
    void Close() override
    {
        m_closed.push_back(m_name);
        if (alsoCloses)
            alsoCloses->Unregister();
        if (unregistersOnClose)
            Unregister();
    }
    void Unregister()
    {
        if (std::exchange(m_registered, false))
            m_list.Unregister(m_position);
    }

    Window *alsoCloses = nullptr;
    bool unregistersOnClose = true;

private:
    OpenDialogList &m_list;
    Names &m_closed;
    std::string m_name;
    OpenDialogList::Position m_position;
    bool m_registered = true;
};

TEST(OpenDialogList, ClosesTheNewestFirstAndSurvivesWindowsThatRemoveEntries)
{
    OpenDialogList list;
    Names closed;
    OpenDialogList::Position unused;
    list.Register(nullptr, &unused);
    Window a(list, closed, "a"), b(list, closed, "b"), c(list, closed, "c"), d(list, closed, "d");
    list.Register(&a, nullptr);
    EXPECT_EQ(list.Count(), 4u) << "null arguments register nothing";

    d.alsoCloses = &c; // the entry after the one being closed goes too
    b.unregistersOnClose = false;
    list.CloseAll();
    EXPECT_EQ(closed, (Names{"d", "b", "a"}));
    EXPECT_EQ(list.Count(), 1u) << "b is still open";
    b.Unregister();
    EXPECT_EQ(list.Count(), 0u);
}

TEST(OpenDialogList, EntriesLastAsLongAsTheirWindow)
{
    OpenDialogList list;
    {
        struct Plain final : INonModalDialog
        {
            void Close() override {}
        } window;
        sharedsource::OpenDialogEntry entry(window, list);
        EXPECT_EQ(list.Count(), 1u);
    }
    EXPECT_EQ(list.Count(), 0u);
}

} // namespace

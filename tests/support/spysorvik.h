#pragma once

// Server objects that pass every call on to real ones (the reference
// libraries') and write it into a call log, so a test can check what reached
// the server and make chosen operations fail. A failing operation sets the
// status the test named and does not call through.

#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace testsupport {

// Calls may come from worker threads too (the wait window's).
class CallLog final
{
public:
    // One line per call: the operation's name, then its text arguments
    // (paths, names, numbers) separated by " | ". Read it when no worker runs.
    std::vector<std::string> calls;
    // Operations that fail, by name, with the status they set.
    std::map<std::string, std::int32_t, std::less<>> failures;
    // When set, GetIndexManager answers null as if no server ran.
    bool noIndexManager = false;
    // When set, GetIndexManager answers a spy on this one instead of the real one.
    cv::krn::RefPtr<cv::rovo::IIndexManager> indexManager;

    int Count(std::string_view operation) const;
    // The calls whose operation is one of names, in order.
    std::vector<std::string> Only(std::initializer_list<std::string_view> names) const;
    void Clear();

    // Records the call; false when the test made it fail (status set).
    bool Enter(std::string_view operation, std::int32_t *status, const std::vector<std::string> &arguments = {});

private:
    mutable std::mutex m_lock;
};

// The spy of sorvik: its view, editor and index manager are spies too.
cv::krn::RefPtr<cv::rovo::ISorvik> SpyOn(cv::krn::RefPtr<cv::rovo::ISorvik> sorvik, std::shared_ptr<CallLog> log);

// Views and editors for a test's own wrapper objects.
cv::krn::RefPtr<cv::rovo::IConfigurationView> SpyOn(cv::krn::RefPtr<cv::rovo::IConfigurationView> view,
                                                    std::shared_ptr<CallLog> log);
cv::krn::RefPtr<cv::rovo::IConfigurationEditor> SpyOn(cv::krn::RefPtr<cv::rovo::IConfigurationEditor> editor,
                                                      std::shared_ptr<CallLog> log);

// The real object behind a spy editor (the editor itself when it is none):
// what the real view needs for import and export.
cv::rovo::IConfigurationEditor *Unwrapped(cv::rovo::IConfigurationEditor *editor);

} // namespace testsupport

#pragma once

#include "entry/serviceui.h"

#include <string>
#include <vector>

namespace cv::vek::rovo::testing {

// Answers the service object's dialogs and questions as the test says and
// records what was asked.
class ScriptedUi final : public IServiceUi
{
public:
    std::int32_t dialogResult = kModalOk;
    SearchAreaDialogData entered; // typed into the search-area dialog before OK
    bool confirm = true;

    std::vector<std::string> calls;
    SearchAreaDialogData shown; // what the search-area dialog opened with
    int waitDepth = 0;

    std::int32_t RunConfigurationDialog(const krn::WString &, const HostSettings &) override
    {
        return Record("configuration", dialogResult);
    }
    std::int32_t RunOptimizeDialog(const krn::WString &, const HostSettings &) override
    {
        return Record("optimize", dialogResult);
    }
    std::int32_t RunResetDialog(cv::rovo::ISorvik &, const HostSettings &) override
    {
        return Record("reset", dialogResult);
    }
    std::int32_t RunSearchAreaDialog(SearchAreaDialogData &data, IInputTester &, const HostSettings &) override
    {
        shown = data;
        if (dialogResult == kModalOk)
            data = SearchAreaDialogData{data.editMode, entered.alias, entered.path, entered.clientPath};
        return Record(data.editMode ? "edit" : "add", dialogResult);
    }
    bool ConfirmExcludeFolder(std::u16string_view) override { return Record("confirm exclude", confirm); }
    bool ConfirmRemoveSearchArea(std::u16string_view) override { return Record("confirm remove", confirm); }
    void ReportUnknownError() override { calls.push_back("unknown error"); }
    void BeginWaitCursor() override { ++waitDepth; }
    void EndWaitCursor() override { --waitDepth; }

private:
    template <typename T>
    T Record(const char *call, T result)
    {
        calls.push_back(call);
        return result;
    }
};

} // namespace cv::vek::rovo::testing

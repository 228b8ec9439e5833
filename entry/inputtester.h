#pragma once

// Answers the Add/Edit Search Area dialog's questions from the Sorvik's
// configuration view and editor.

#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"
#include "sorvik/serverdialogs.h"

namespace cv::vek::rovo {

class CServerDialogsInputTester final : public IInputTester
{
public:
    CServerDialogsInputTester(krn::RefPtr<cv::rovo::IConfigurationView> view,
                              krn::RefPtr<cv::rovo::IConfigurationEditor> editor);

    // Each walks the search areas in their configured order and stops at
    // the first match; names and paths are compared ignoring case.
    bool IsAliasInUse(const krn::WString &alias) override;
    std::int32_t TestClientPath(const krn::WString &clientPath, krn::WString &alias) override;
    std::int32_t TestPath(const krn::WString &path, krn::WString &alias) override;
    std::int32_t CheckPathAllowed(const krn::WString &serverPath, const krn::WString &path,
                                  const krn::WString &alias) override;

private:
    enum class Compare
    {
        Path,
        ClientPath
    };
    std::int32_t Test(Compare compare, const krn::WString &path, krn::WString &alias);

    // Declared in this order so that the editor is released first.
    krn::RefPtr<cv::rovo::IConfigurationView> m_view;
    krn::RefPtr<cv::rovo::IConfigurationEditor> m_editor;
};

} // namespace cv::vek::rovo

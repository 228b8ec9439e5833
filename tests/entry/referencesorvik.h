#pragma once

// The reference-store fixture with the module started as a host starts it,
// and a service object for the local Sorvik.

#include "entry/module.h"
#include "entry/serverdialogs.h"
#include "scriptedui.h"
#include "support/referencestore.h"

namespace cv::vek::rovo::testing {

using testsupport::Folder;
using testsupport::Lines;
using testsupport::Narrow;

class ReferenceSorvik : public testsupport::ReferenceStore
{
protected:
    void SetUp() override;
    void TearDown() override;

    // A service object for the local Sorvik using m_ui, counting the Sorvik objects it opens.
    CServerDialogs &Service();

    ScriptedUi m_ui;
    int m_opened = 0;

private:
    CServerDialogs *m_service = nullptr;
};

} // namespace cv::vek::rovo::testing

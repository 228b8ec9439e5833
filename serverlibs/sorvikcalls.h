#pragma once

// The Sorvik object's operations as the dialogs call them: each library
// status becomes cv::vek::Exception, each object comes with its reference.

#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"
#include "sorvik/wstring.h"

namespace cv::vek::rovo::serverlibs {

krn::WString SorvikName(cv::rovo::ISorvik &sorvik);
// Null when the library has none.
krn::RefPtr<cv::rovo::IConfigurationView> GetConfigurationView(cv::rovo::ISorvik &sorvik);
krn::RefPtr<cv::rovo::IConfigurationEditor> GetConfigurationEditor(cv::rovo::ISorvik &sorvik);
// Null when no server runs.
krn::RefPtr<cv::rovo::IIndexManager> GetIndexManager(cv::rovo::ISorvik &sorvik);

void ImportConfiguration(cv::rovo::IConfigurationView &view, const krn::WString &file,
                         cv::rovo::IConfigurationEditor &editor);
void ExportConfiguration(cv::rovo::IConfigurationView &view, const krn::WString &file,
                         cv::rovo::IConfigurationEditor &editor);

// Returns when the server has applied what was committed; raises -1008 when
// the library's own time-out passed first.
void WaitForUpdate(cv::rovo::IIndexManager &indexManager);

} // namespace cv::vek::rovo::serverlibs

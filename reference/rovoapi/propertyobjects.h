#pragma once

// The property side of a running server's index manager: the property
// model with its levels and translator, the level property lists, the index
// status and the optimization editor. The first three ask the server over
// the manager channel; the optimization editor commits through the store,
// like every configuration change, so WaitForUpdate waits for it.

#include "reference/rovoapi/managerinstance.h"
#include "sorvik/rovoapi.h"

#include <QString>

#include <memory>

namespace sorvik::rovo {

// The level key ("sorvik_root", "qdm_channelgroup", "qdm_channel", case
// ignored) in the server's spelling; raises NotFound for any other.
QString RequireLevelKey(const cv::krn::WString &level);

cv::rovo::IPropertyModel *NewPropertyModel(const Instance &instance);
cv::rovo::ILevelPropertyList *NewLevelPropertyList(std::shared_ptr<const Instance> instance, QString levelKey);
cv::rovo::IIndexStatus *NewIndexStatus(std::shared_ptr<const Instance> instance);
cv::rovo::IOptimizationEditor *NewOptimizationEditor(QString storeFile);

} // namespace sorvik::rovo

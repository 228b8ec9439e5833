#pragma once

#include <QString>

#include <string_view>

namespace sorvik::server {

// The index folder of the Sorvik this server instance serves, read from its
// committed configuration through the server API library (found through the
// registry like every client finds it). Raises std::runtime_error.
QString IndexFolderOf(std::u16string_view portName);

} // namespace sorvik::server

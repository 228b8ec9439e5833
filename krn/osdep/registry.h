#pragma once

#include <string>
#include <string_view>

namespace cv::krn::osdep {

enum class RegistryHive
{
    LocalMachine,
};

enum class RegistryView
{
    Default,
    Bits32,
};

// Reads a string value of the machine registry. On this platform the
// registry is the INI file of RegistryFilePath(): one section per key path
// (for example "[Software\Corvane\Common\Sorvik]") holding "name=value"
// lines; key paths and value names match case-insensitively, as in the
// registry. Both views read the same file. A missing file, key or value
// gives defaultValue. The file is read on every call, so changes show at
// once.
std::u16string ReadRegistryString(RegistryHive hive, std::u16string_view key, std::u16string_view value,
                                  std::u16string_view defaultValue = {},
                                  RegistryView view = RegistryView::Default);

} // namespace cv::krn::osdep

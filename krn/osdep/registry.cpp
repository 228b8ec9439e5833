#include "krn/osdep/registry.h"

#include "krn/osdep/configpaths.h"
#include "krn/osdep/inifile.h"

namespace cv::krn::osdep {

std::u16string ReadRegistryString(RegistryHive, std::u16string_view key, std::u16string_view value,
                                  std::u16string_view defaultValue, RegistryView)
{
    const std::optional<std::u16string> found = IniFile::Load(RegistryFilePath()).Value(key, value);
    return found ? *found : std::u16string(defaultValue);
}

} // namespace cv::krn::osdep

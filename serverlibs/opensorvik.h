#pragma once

// Opening the Sorvik object that a connection text names.

#include "serverlibs/rovoapilibrary.h"
#include "serverlibs/vekexlibrary.h"
#include "sorvik/refcounted.h"
#include "sorvik/rovoapi.h"
#include "sorvik/wstring.h"

#include <cstdint>
#include <string_view>

namespace cv::vek::rovo::serverlibs {

// The packed version 18.0.0, build 7096, that the module reports and asks for.
constexpr std::uint32_t kModuleVersion = 75504568;

enum class SorvikKind : std::int32_t
{
    Desktop = 0,
    Valdorn = 1, // the first element tagged "SorvikType" holds "valdorn"
};

// Scans the tagged elements "<tag attributes>value</tag>" of a connection
// text; a tag ends at a blank, tab, line feed, carriage return or ">". Tag
// and value are compared exactly, and only the first SorvikType element counts.
SorvikKind KindOfConnection(std::u16string_view connection);

struct OpenedSorvik
{
    krn::RefPtr<cv::rovo::ISorvik> sorvik; // null when the library has none for the text
    SorvikKind kind = SorvikKind::Desktop;
};

// Builds a data-store environment of the connection's kind, the server
// environment on it and opens the Sorvik object; both environments are
// released again. Library failures raise cv::vek::Exception.
OpenedSorvik OpenSorvik(const krn::WString &connection, VekexLibrary &vekex, RovoApiLibrary &rovoApi);
// The same through the module's bindings.
OpenedSorvik OpenSorvik(const krn::WString &connection);

} // namespace cv::vek::rovo::serverlibs

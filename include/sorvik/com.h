#pragma once

// The component-object basics shared by the module, its hosts and the product
// libraries: GUID, HRESULT and IUnknown with the binary layout and virtual slot
// order that separately compiled parties rely on.

#include <cstdint>
#include <cstring>

#define SORVIK_EXPORT __attribute__((visibility("default")))

using HRESULT = std::int32_t;
using ULONG = std::uint32_t;

constexpr HRESULT S_OK = 0;
constexpr HRESULT S_FALSE = 1;
constexpr HRESULT E_NOTIMPL = static_cast<HRESULT>(0x80004001u);
constexpr HRESULT E_NOINTERFACE = static_cast<HRESULT>(0x80004002u);
constexpr HRESULT E_POINTER = static_cast<HRESULT>(0x80004003u);
constexpr HRESULT E_FAIL = static_cast<HRESULT>(0x80004005u);
constexpr HRESULT E_OUTOFMEMORY = static_cast<HRESULT>(0x8007000Eu);
constexpr HRESULT E_INVALIDARG = static_cast<HRESULT>(0x80070057u);
constexpr HRESULT CLASS_E_CLASSNOTAVAILABLE = static_cast<HRESULT>(0x80040111u);

constexpr bool SUCCEEDED(HRESULT hr) { return hr >= 0; }
constexpr bool FAILED(HRESULT hr) { return hr < 0; }

struct GUID
{
    std::uint32_t Data1;
    std::uint16_t Data2;
    std::uint16_t Data3;
    std::uint8_t Data4[8];

    friend constexpr bool operator==(const GUID &a, const GUID &b)
    {
        if (a.Data1 != b.Data1 || a.Data2 != b.Data2 || a.Data3 != b.Data3)
            return false;
        for (int i = 0; i < 8; ++i) {
            if (a.Data4[i] != b.Data4[i])
                return false;
        }
        return true;
    }
};
static_assert(sizeof(GUID) == 16);

using IID = GUID;
using CLSID = GUID;
using REFIID = const IID &;
using REFCLSID = const CLSID &;

namespace sorvik::detail {

constexpr std::uint32_t hexDigit(char c)
{
    if (c >= '0' && c <= '9')
        return std::uint32_t(c - '0');
    if (c >= 'a' && c <= 'f')
        return std::uint32_t(c - 'a' + 10);
    if (c >= 'A' && c <= 'F')
        return std::uint32_t(c - 'A' + 10);
    throw "invalid hexadecimal digit in GUID text"; // only reached at compile time
}

constexpr std::uint32_t hexValue(const char *text, int digits)
{
    std::uint32_t value = 0;
    for (int i = 0; i < digits; ++i)
        value = value << 4 | hexDigit(text[i]);
    return value;
}

} // namespace sorvik::detail

// Parses "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}" at compile time.
constexpr GUID MakeGuid(const char (&text)[39])
{
    using sorvik::detail::hexValue;
    GUID g{hexValue(text + 1, 8), std::uint16_t(hexValue(text + 10, 4)),
           std::uint16_t(hexValue(text + 15, 4)), {}};
    const int offsets[8] = {20, 22, 25, 27, 29, 31, 33, 35};
    for (int i = 0; i < 8; ++i)
        g.Data4[i] = std::uint8_t(hexValue(text + offsets[i], 2));
    return g;
}

constexpr IID IID_IUnknown = MakeGuid("{00000000-0000-0000-C000-000000000046}");
constexpr IID IID_IClassFactory = MakeGuid("{00000001-0000-0000-C000-000000000046}");

struct SORVIK_EXPORT IUnknown
{
    virtual HRESULT QueryInterface(REFIID iid, void **object) = 0;
    virtual ULONG AddRef() = 0;
    virtual ULONG Release() = 0;

protected:
    ~IUnknown() = default;
};

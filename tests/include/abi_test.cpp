// The public headers are an ABI: these tests read objects the way a separately
// compiled host or library would, through raw bytes and raw vtable slots.

#include "sorvik/bstr.h"
#include "sorvik/com.h"
#include "sorvik/logfont.h"
#include "sorvik/packedversion.h"

#include <gtest/gtest.h>

#include <array>
#include <cstring>

namespace {

TEST(Guid, ParsesTextIntoTheBinaryLayout)
{
    constexpr GUID id = MakeGuid("{AB68ECEC-D36A-4054-AE3D-C3C1226C3C4B}");
    const std::array<unsigned char, 16> expected = {0xEC, 0xEC, 0x68, 0xAB, 0x6A, 0xD3, 0x54, 0x40,
                                                    0xAE, 0x3D, 0xC3, 0xC1, 0x22, 0x6C, 0x3C, 0x4B};
    std::array<unsigned char, 16> bytes{};
    std::memcpy(bytes.data(), &id, sizeof id);
    EXPECT_EQ(bytes, expected);

    constexpr GUID lower = MakeGuid("{ab68ecec-d36a-4054-ae3d-c3c1226c3c4b}");
    EXPECT_EQ(id, lower);
    constexpr GUID other = MakeGuid("{AB68ECEC-D36A-4054-AE3D-C3C1226C3C4C}");
    EXPECT_FALSE(id == other);
}

class Counted final : public IUnknown
{
public:
    HRESULT QueryInterface(REFIID iid, void **object) override
    {
        if (iid == IID_IUnknown) {
            *object = this;
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG AddRef() override { return ++count; }
    ULONG Release() override { return --count; }
    ULONG count = 1;
};

TEST(IUnknownSlots, AreQueryInterfaceAddRefReleaseInThatOrder)
{
    Counted object;
    using AddRefSlot = ULONG (*)(void *);
    using QuerySlot = HRESULT (*)(void *, const IID &, void **);
    void **vtable = *reinterpret_cast<void ***>(&object);

    void *out = nullptr;
    EXPECT_EQ(reinterpret_cast<QuerySlot>(vtable[0])(&object, IID_IUnknown, &out), S_OK);
    EXPECT_EQ(out, &object);
    EXPECT_EQ(reinterpret_cast<AddRefSlot>(vtable[1])(&object), 3u);
    EXPECT_EQ(reinterpret_cast<AddRefSlot>(vtable[2])(&object), 2u);
    EXPECT_EQ(reinterpret_cast<QuerySlot>(vtable[0])(&object, IID_IClassFactory, &out), E_NOINTERFACE);
    EXPECT_EQ(out, nullptr);
}

TEST(Bstr, CarriesItsByteLengthInFrontAndATerminator)
{
    BSTR text = SysAllocString(u"help-topic");
    ASSERT_NE(text, nullptr);
    std::uint32_t prefix = 0;
    std::memcpy(&prefix, reinterpret_cast<unsigned char *>(text) - 4, 4);
    EXPECT_EQ(prefix, 20u);
    EXPECT_EQ(SysStringLen(text), 10u);
    EXPECT_EQ(text[10], u'\0');
    SysFreeString(text);

    // Embedded NULs count; a null source gives zeroed characters.
    BSTR withNul = SysAllocStringLen(u"a\0b", 3);
    EXPECT_EQ(SysStringLen(withNul), 3u);
    EXPECT_EQ(withNul[2], u'b');
    SysFreeString(withNul);
    BSTR blank = SysAllocStringLen(nullptr, 2);
    EXPECT_EQ(blank[0], u'\0');
    SysFreeString(blank);

    EXPECT_EQ(SysAllocString(nullptr), nullptr);
    EXPECT_EQ(SysStringLen(nullptr), 0u);
    SysFreeString(nullptr);
    EXPECT_EQ(SysAllocStringLen(u"", 0x7FFFFFFFu), nullptr) << "an impossible length must not wrap";
}

TEST(LogFont, FieldsSitWhereAHostPutsThem)
{
    unsigned char raw[92] = {};
    const std::int32_t height = -13, weight = 700;
    std::memcpy(raw + 0, &height, 4);
    std::memcpy(raw + 16, &weight, 4);
    raw[20] = 1;  // italic
    raw[23] = 0;  // character set
    raw[27] = 34; // pitch and family
    const char16_t face[] = u"Segoe UI";
    std::memcpy(raw + 28, face, sizeof face);

    LOGFONTW font;
    std::memcpy(&font, raw, sizeof font);
    EXPECT_EQ(font.lfHeight, -13);
    EXPECT_EQ(font.lfWeight, 700);
    EXPECT_EQ(font.lfItalic, 1);
    EXPECT_EQ(font.lfPitchAndFamily, 34);
    EXPECT_EQ(std::u16string_view(font.lfFaceName), u"Segoe UI");
}

TEST(PackedVersion, SplitsIntoItsFields)
{
    using namespace sorvik;
    EXPECT_EQ(PackVersion(18, 0, 0), 0x4800000u);
    const std::uint32_t v = PackVersion(3, 1, 2, 77);
    EXPECT_EQ(VersionMajor(v), 3u);
    EXPECT_EQ(VersionMinor(v), 1u);
    EXPECT_EQ(VersionPatch(v), 2u);
    EXPECT_EQ(VersionBuild(v), 77u);
    EXPECT_EQ(VersionWithoutBuild(75504568u), 0x4800000u);
    EXPECT_LT(PackVersion(3, 1, 0), PackVersion(3, 2, 0));
    EXPECT_LT(PackVersion(2, 15, 15), PackVersion(3, 0, 0));
}

} // namespace

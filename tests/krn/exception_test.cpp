#include "krn/exception/accessdenied.h"
#include "krn/exception/boundexceeded.h"
#include "krn/exception/bufferoverflow.h"
#include "krn/exception/deserializationerror.h"
#include "krn/exception/filealreadyexists.h"
#include "krn/exception/filereadfailed.h"
#include "krn/exception/filewritefailed.h"
#include "krn/exception/invalidargument.h"
#include "krn/exception/invalidlocale.h"
#include "krn/exception/invalidoperation.h"
#include "krn/exception/invalidsequence.h"
#include "krn/exception/nonexistentexception.h"
#include "krn/exception/notimplemented.h"
#include "krn/exception/objectalreadyexists.h"
#include "krn/exception/outofrange.h"
#include "krn/exception/unabletoconvert.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>

namespace cv::krn::exception {
namespace {

struct Expected
{
    std::function<std::unique_ptr<Exception>()> make;
    const char *description;
    std::uint32_t code;
};

template<typename T>
std::function<std::unique_ptr<Exception>()> Make()
{
    return [] { return std::make_unique<T>(); };
}

TEST(KrnException, EveryClassHasItsDescriptionAndCode)
{
    const Expected table[] = {
        {Make<Exception>(), "unspecified exception", 0xFFFFFFFF},
        {Make<OutOfRange>(), "Out of range", 0x8ABC7007},
        {Make<BoundExceeded>(), "A request was made that would exceed the bounds", 0x8ABC7007},
        {Make<BufferOverflow>(), "Buffer overflowed", 0x8ABC7017},
        {Make<DeserializationError>(), "Failed to deserialize", 0x8ABC7014},
        {Make<InvalidArgument>(), "Invalid argument(s)", 0x8ABC700F},
        {Make<InvalidSequence>(), "Invalid UTF8 encoding sequence", 0x8ABC7030},
        {Make<InvalidOperation>(), "Invalid operation", 0x8ABC700E},
        {Make<UnableToConvert>(), "Unable to convert.", 0x8ABC7034},
        {Make<InvalidLocale>(), "Invalid locale", 0x8ABC7024},
        {Make<AccessDenied>(), "Access denied: ", 0x8ABC7019},
        {Make<FileAlreadyExists>(), "File already exists", 0x8ABC701B},
        {Make<FileReadFailed>(), "Read file operation failed", 0x8ABC7012},
        {Make<FileWriteFailed>(), "Write file operation failed", 0x8ABC7011},
        {Make<NonexistentException>(), "The object does not exist", 0x8ABC700A},
        {Make<ObjectAlreadyExists>(), "Object already exists", 0x8ABC7009},
        {Make<NotImplemented>(), "Not implemented", 0x80004001},
    };
    for (const Expected &row : table) {
        const std::unique_ptr<Exception> error = row.make();
        EXPECT_EQ(error->Description(), row.description);
        EXPECT_STREQ(error->what(), row.description);
        EXPECT_EQ(error->Code(), row.code) << row.description;
        EXPECT_EQ(error->SourceLine(), 0u);
        EXPECT_FALSE(error->SourceFile().has_value());
    }
}

TEST(KrnException, DetailVariantsBuildTheirDescription)
{
    EXPECT_EQ(OutOfRange("index 7").Description(), "Out of range: index 7");
    EXPECT_EQ(OutOfRange(u"index 7").Description(), "Out of range: index 7");
    EXPECT_EQ(BoundExceeded(u"size 9 > 8").Description(),
              "A request was made that would exceed the bounds: size 9 > 8");
    EXPECT_EQ(InvalidArgument("name is empty").Description(), "name is empty");
    EXPECT_EQ(AccessDenied(u"C:\\data").Description(), "Access denied: C:\\data");
    EXPECT_EQ(OutOfRange("index 7").Code(), 0x8ABC7007u);
    // A wide detail arrives as UTF-8, a surrogate pair included.
    EXPECT_EQ(InvalidArgument(u"Gr\u00FC\u00DFe \U0001F600").Description(), "Gr\xC3\xBC\xC3\x9F" "e \xF0\x9F\x98\x80");
}

TEST(KrnException, KeepsTheSourcePositionAndSurvivesCopies)
{
    OutOfRange original(u"index 7", "buffer.cpp", 120);
    const OutOfRange copy = original;
    EXPECT_EQ(copy.SourceFile(), "buffer.cpp");
    EXPECT_EQ(copy.SourceLine(), 120u);
    EXPECT_STREQ(copy.what(), "Out of range: index 7");
    EXPECT_EQ(BufferOverflow("record.cpp", 7).SourceLine(), 7u);
    static_assert(std::is_nothrow_copy_constructible_v<OutOfRange>);

    try {
        throw DeserializationError("record.cpp", 33);
    } catch (const std::exception &error) {
        EXPECT_STREQ(error.what(), "Failed to deserialize");
    }
}

} // namespace
} // namespace cv::krn::exception

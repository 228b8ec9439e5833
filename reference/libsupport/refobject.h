#pragma once

// Shared pieces of the reference product libraries: reference-counted object
// bases, string lists, and the guard that turns internal failures into the
// status codes of the ABI. Linked statically into each library, so each keeps
// its own copy (and its own last-error text).

#include "sorvik/vekex.h"
#include "sorvik/wstring.h"

#include <atomic>
#include <cstdint>
#include <new>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace sorvik::ref {

// Implements AddRef and Release for every interface it derives from.
template <typename... Interfaces>
class RefObject : public Interfaces...
{
public:
    RefObject() = default;
    RefObject(const RefObject &) = delete;
    RefObject &operator=(const RefObject &) = delete;

    std::uint32_t AddRef() override { return m_count.fetch_add(1, std::memory_order_relaxed) + 1; }
    std::uint32_t Release() override
    {
        const std::uint32_t left = m_count.fetch_sub(1, std::memory_order_acq_rel) - 1;
        if (left == 0)
            delete this;
        return left;
    }

protected:
    virtual ~RefObject() = default;

private:
    std::atomic<std::uint32_t> m_count{1};
};

// A list of texts handed to a caller; it never changes after creation.
class StringList final : public RefObject<cv::vekex::IStringList>
{
public:
    explicit StringList(std::vector<cv::krn::WString> items) : m_items(std::move(items)) {}

    std::uint32_t GetCount() override { return std::uint32_t(m_items.size()); }
    const cv::krn::WString *GetElements() override { return m_items.empty() ? nullptr : m_items.data(); }

private:
    std::vector<cv::krn::WString> m_items;
};

// An internal failure: the status code the caller receives and a text for
// the last-error query.
struct Failure
{
    std::int32_t code;
    std::u16string text;
};

[[noreturn]] void Fail(std::int32_t code, std::u16string text);

// The text of the last failure reported on this thread by this library.
void SetLastErrorText(std::u16string text);
const std::u16string &LastErrorText();

struct StatusCodes
{
    std::int32_t outOfMemory;
    std::int32_t invalidArgument;
    std::int32_t internal;
};

// Runs body; a Failure, a memory shortage or any other exception becomes a
// status code (and a last-error text) and the result is a default value.
// A null status pointer is refused without running body.
template <typename Body>
auto Guarded(const StatusCodes &codes, std::int32_t *status, Body &&body) -> decltype(body())
{
    using Result = decltype(body());
    auto failed = [&](std::int32_t code, std::u16string text) {
        SetLastErrorText(std::move(text));
        if (status)
            *status = code;
        if constexpr (!std::is_void_v<Result>)
            return Result{};
    };
    if (!status)
        return failed(codes.invalidArgument, u"the status pointer is null");
    try {
        return body();
    } catch (const Failure &failure) {
        return failed(failure.code, failure.text);
    } catch (const std::bad_alloc &) {
        return failed(codes.outOfMemory, u"out of memory");
    } catch (const std::exception &) {
        return failed(codes.internal, u"unexpected internal failure");
    }
}

} // namespace sorvik::ref

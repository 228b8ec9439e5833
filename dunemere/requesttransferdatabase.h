#pragma once

#include "sorvik/bytebuffer.h"
#include "sorvik/com.h"
#include "sorvik/packedversion.h"

#include <cstddef>
#include <cstdint>
#include <span>

namespace cv::vek::rovo {

class TransferReader;
class TransferWriter;

// The version this client speaks, and the highest it ever speaks.
inline constexpr std::uint32_t kClientVersion = sorvik::PackVersion(18, 0, 0);

// Header shared by every request record: size tag, version, reserved word,
// category, code and request identifier (36 bytes). Subclasses append their
// fields after it.
class CRequestTransferDataBase
{
public:
    static constexpr std::uint32_t kSizeTag = 48;
    static constexpr std::size_t kHeaderSize = 36;

    // Without arguments: the authentication-step request (category 4, code
    // 3002) at the client's version. Every record gets a fresh identifier.
    explicit CRequestTransferDataBase(std::uint32_t version = kClientVersion, std::uint32_t category = 4,
                                      std::uint32_t code = 3002);
    CRequestTransferDataBase(const CRequestTransferDataBase &) = default;
    CRequestTransferDataBase &operator=(const CRequestTransferDataBase &) = default;
    virtual ~CRequestTransferDataBase();

    virtual std::uint32_t SizeTag() const { return kSizeTag; }

    std::uint32_t Version() const noexcept { return m_version; }
    void SetVersion(std::uint32_t version) noexcept { m_version = version; }
    std::uint32_t Category() const noexcept { return m_category; }
    void SetCategory(std::uint32_t category) noexcept { m_category = category; }
    std::uint32_t Code() const noexcept { return m_code; }
    void SetCode(std::uint32_t code) noexcept { m_code = code; }
    const GUID &RequestIdentifier() const noexcept { return m_requestIdentifier; }
    void SetRequestIdentifier(const GUID &identifier) noexcept { m_requestIdentifier = identifier; }
    // A record sent again (after a new log-on) must not be mistaken for its
    // first sending, so it gets a new identifier.
    void RenewRequestIdentifier();

    // Appends the record to out. Returns false when memory runs out; out is
    // then undefined. A record that cannot be encoded (see subclasses) throws
    // before anything is appended.
    bool Serialize(krn::ByteBuffer &out) const;

    // Reads the record at position and moves position past it (the server's
    // direction). Truncated or malformed input throws
    // krn::exception::DeserializationError, a length above a fixed limit
    // krn::exception::BufferOverflow; position is then left unchanged and the
    // record's content is unspecified. The size tag is not checked: category
    // and code tell the kinds apart.
    void Deserialize(std::span<const std::uint8_t> bytes, std::size_t &position);
    void Deserialize(const krn::ByteBuffer &bytes, std::size_t &position) { Deserialize(bytes.bytes(), position); }

protected:
    // Refuses a record that must not be sent; runs before anything is written.
    virtual void CheckSendable() const {}
    // Base fields first, then each subclass's own.
    virtual void Write(TransferWriter &out) const;
    virtual void Read(TransferReader &in);

private:
    std::uint32_t m_version;
    std::uint32_t m_category;
    std::uint32_t m_code;
    GUID m_requestIdentifier;
};

} // namespace cv::vek::rovo

#pragma once

#include "dunemere/requesttransferdatabase.h"

#include <array>
#include <string>
#include <string_view>
#include <vector>

namespace cv::vek::rovo {

// How many string parameters a request of this version, category and code
// carries on the wire. Older servers expect fewer, so it depends on version.
std::uint32_t RequestParameterCount(std::uint32_t version, std::uint32_t category, std::uint32_t code);

// A request with a numeric argument block, an identifier list (category 2,
// code 1004 only) and string parameters.
class tRequestTransferData final : public CRequestTransferDataBase
{
public:
    static constexpr std::uint32_t kSizeTag = 104;

    explicit tRequestTransferData(std::uint32_t version = kClientVersion, std::uint32_t category = 0,
                                  std::uint32_t code = 0);

    std::uint32_t SizeTag() const override { return kSizeTag; }

    // The four argument words; a request puts its value in the word its
    // code prescribes.
    std::array<std::uint32_t, 4> &Arguments() noexcept { return m_arguments; }
    const std::array<std::uint32_t, 4> &Arguments() const noexcept { return m_arguments; }

    // count entries are copied; a negative count stores an empty list.
    void SetIdentifiers(const GUID *identifiers, std::int32_t count);
    const std::vector<GUID> &Identifiers() const noexcept { return m_identifiers; }
    // The count field as sent. It equals Identifiers().size() except for a
    // received request of another category and code, whose list is not on
    // the wire.
    std::int32_t IdentifierCount() const noexcept { return m_identifierCount; }
    bool CarriesIdentifierList() const noexcept { return Category() == 2 && Code() == 1004; }

    std::size_t ParameterCount() const noexcept { return m_parameters.size(); }
    void AppendParameter(std::u16string text) { m_parameters.push_back(std::move(text)); }
    // An index beyond the parameters raises cv::vek::Exception -1007
    // "illegal number of parameters".
    const std::u16string &Parameter(std::size_t index) const;
    // The same, but an empty text for an index beyond the parameters.
    std::u16string_view ParameterOrEmpty(std::size_t index) const noexcept;
    const std::vector<std::u16string> &Parameters() const noexcept { return m_parameters; }

protected:
    // A request holding fewer parameters than RequestParameterCount demands
    // would desynchronise the server's reader: raises -1007 instead.
    void CheckSendable() const override;
    void Write(TransferWriter &out) const override;
    void Read(TransferReader &in) override;

private:
    std::array<std::uint32_t, 4> m_arguments{};
    std::int32_t m_identifierCount = 0;
    std::vector<GUID> m_identifiers;
    std::vector<std::u16string> m_parameters;
};

} // namespace cv::vek::rovo

#pragma once

#include "krn/osdep/ihostnetwork.h"
#include "krn/osdep/notresolvedexception.h"

#include <map>
#include <memory>

namespace krntest {

// A network layer made of tables. The state is shared so that a test can
// still change and inspect it after a HostInfo took the layer over; HostInfo
// calls it under its own lock only.
class FakeHostNetwork final : public cv::krn::osdep::IHostNetwork
{
public:
    struct State
    {
        std::u16string hostName = u"testhost";
        std::map<std::u16string, std::vector<QHostAddress>, std::less<>> names;
        std::optional<std::vector<cv::krn::osdep::NetworkAdapter>> adapters =
            std::vector<cv::krn::osdep::NetworkAdapter>{};
        std::vector<std::u16string> resolved;
        int adapterQueries = 0;
    };

    explicit FakeHostNetwork(std::shared_ptr<State> state)
        : m_state(std::move(state))
    {
    }

    std::u16string LocalHostName() override { return m_state->hostName; }

    std::vector<QHostAddress> Resolve(std::u16string_view host) override
    {
        m_state->resolved.emplace_back(host);
        const auto found = m_state->names.find(host);
        if (found == m_state->names.end())
            throw cv::krn::osdep::NotResolvedException();
        return found->second;
    }

    std::optional<std::vector<cv::krn::osdep::NetworkAdapter>> Adapters() override
    {
        ++m_state->adapterQueries;
        return m_state->adapters;
    }

private:
    std::shared_ptr<State> m_state;
};

} // namespace krntest

#include "reference/server/kerberoslogon.h"

#include "reference/kerberosaccept/kerberosacceptor.h"
#include "reference/server/logonacceptor.h"

#include <QString>

#include <cstdio>
#include <stdexcept>

namespace sorvik::server {

namespace {

using cv::vek::rovo::kerberos::KerberosAcceptor;

class KerberosLogOn final : public ILogOnAcceptor
{
public:
    KerberosLogOn(const std::string &keytab, const std::string &principal)
    {
        try {
            m_acceptor = std::make_unique<KerberosAcceptor>(keytab, principal);
        } catch (const std::exception &failure) {
            m_setUpError = failure.what();
        }
    }

    Step Accept(std::span<const std::uint8_t> token) override
    {
        Step step;
        if (!m_acceptor) {
            step.error = m_setUpError;
        } else {
            auto result = m_acceptor->Step(token);
            step.token = std::move(result.token);
            step.error = std::move(result.error);
            switch (result.outcome) {
            case KerberosAcceptor::Outcome::Continue: step.kind = Step::Kind::Continue; break;
            case KerberosAcceptor::Outcome::Complete:
                step.kind = Step::Kind::Complete;
                step.clientName = QString::fromStdString(m_acceptor->ClientName()).toStdU16String();
                break;
            case KerberosAcceptor::Outcome::Failed: step.kind = Step::Kind::Failed; break;
            }
        }
        if (step.kind == Step::Kind::Failed)
            std::fprintf(stderr, "Sorvik: %s\n", step.error.c_str());
        return step;
    }

private:
    std::unique_ptr<KerberosAcceptor> m_acceptor;
    std::string m_setUpError;
};

} // namespace

Server::AcceptorFactory KerberosAcceptorFactory(const ServerOptions &options)
{
    if (options.keytab.empty())
        return {};
    const std::string principal = QString::fromStdU16String(options.principal).toStdString();
    return [keytab = options.keytab, principal] { return std::make_unique<KerberosLogOn>(keytab, principal); };
}

} // namespace sorvik::server

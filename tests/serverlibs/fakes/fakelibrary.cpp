// A fake data-store library (FAKE_VEKEX) or server API library (FAKE_ROVOAPI)
// for the binding tests. FAKE_PARTIAL leaves out one of the entry points a
// use needs.

#include "fakestate.h"

#include "sorvik/rovoapi.h"
#include "sorvik/vekex.h"

#include <utility>

using cv::krn::WString;

namespace {

FakeState g_state;

template <typename Interface>
class FakeObject : public Interface
{
public:
    FakeObject() { ++g_state.liveObjects; }
    std::uint32_t AddRef() override { return ++m_refs; }
    std::uint32_t Release() override
    {
        if (--m_refs == 0) {
            delete this;
            return 0;
        }
        return m_refs;
    }

protected:
    virtual ~FakeObject() { --g_state.liveObjects; }

private:
    std::uint32_t m_refs = 1;
};

template <typename T>
T *Created(T *object, std::int32_t *status)
{
    if (g_state.passCreations > 0) {
        --g_state.passCreations;
        return object;
    }
    if (std::exchange(g_state.returnNull, false)) {
        object->Release();
        return nullptr;
    }
    if (g_state.failStatus != 0)
        *status = std::exchange(g_state.failStatus, 0);
    return object;
}

class Environment final : public FakeObject<cv::vekex::IEnvironment>
{
public:
    explicit Environment(std::int32_t kind) : m_kind(kind) {}
    cv::vekex::IConfiguration *GetConfiguration(const WString &, std::int32_t, std::int32_t *) override
    {
        return nullptr;
    }
    std::int32_t GetKind(std::int32_t *) override { return m_kind; }

private:
    std::int32_t m_kind;
};

class Sorvik final : public FakeObject<cv::rovo::ISorvik>
{
public:
    WString GetSorvikName(std::int32_t *) override { return {}; }
    cv::rovo::IConfigurationView *GetConfigurationView(std::int32_t *) override { return nullptr; }
    cv::rovo::IConfigurationEditor *GetConfigurationEditor(std::int32_t *) override { return nullptr; }
    cv::rovo::IIndexManager *GetIndexManager(std::int32_t *) override { return nullptr; }
    void ResetSorvik(std::int32_t, std::int32_t, std::int32_t *) override {}
};

class ServerEnvironment final : public FakeObject<cv::rovo::IRovoEnvironment>
{
public:
    cv::rovo::ISorvik *OpenSorvik(const WString &connection, std::int32_t *status) override
    {
        g_state.lastConnection = connection.toU16String();
        return Created(new Sorvik, status);
    }
};

} // namespace

extern "C" {

SORVIK_EXPORT FakeState *fakeState()
{
    return &g_state;
}

void Init(void)
{
    ++g_state.initCalls;
}

void Cleanup(void)
{
    ++g_state.cleanupCalls;
}

#ifdef FAKE_VEKEX
cv::vekex::IEnvironment *vekGetEnvironment(std::int32_t kind, const WString &name, std::uint32_t version,
                                           std::int32_t *status)
{
    g_state.lastKind = kind;
    g_state.lastName = name.toU16String();
    g_state.lastVersion = version;
    return Created(new Environment(kind), status);
}

// The binding needs these to exist; the tests do not call them.
cv::vekex::IContainer *vekCreateContainer(std::int32_t *) { return nullptr; }
cv::vekex::IInstList *vekCreateInstList(std::int32_t *) { return nullptr; }
#ifndef FAKE_PARTIAL
cv::vekex::IContainerList *vekCreateContainerList(std::int32_t *) { return nullptr; }
#endif
#endif

#if defined(FAKE_ROVOAPI) && !defined(FAKE_PARTIAL)
cv::rovo::IRovoEnvironment *rovoCreateEnvironment(cv::vekex::IEnvironment *dataStore, std::int32_t *status)
{
    std::int32_t ignored = 0;
    g_state.dataStoreKind = dataStore ? dataStore->GetKind(&ignored) : -1;
    return Created(new ServerEnvironment, status);
}
#endif

} // extern "C"

#pragma once

// What a fake product library records and how a test steers it. Each fake
// exports `FakeState *fakeState()`; the state starts afresh with every load.

#include <atomic>
#include <cstdint>
#include <string>

struct FakeState
{
    std::atomic<int> initCalls{0}; // uses may be taken from several threads
    std::atomic<int> cleanupCalls{0};
    int liveObjects = 0;
    // The creating call after passCreations others fails with failStatus
    // (still handing out its object) or returns null.
    int passCreations = 0;
    std::int32_t failStatus = 0;
    bool returnNull = false;

    std::int32_t lastKind = 0; // vekGetEnvironment
    std::u16string lastName = u"<none>";
    std::uint32_t lastVersion = 0;
    std::int32_t dataStoreKind = 0; // rovoCreateEnvironment: kind of the environment it got
    std::u16string lastConnection = u"<none>"; // IRovoEnvironment::OpenSorvik
};

using FakeStateFunction = FakeState *(*)();

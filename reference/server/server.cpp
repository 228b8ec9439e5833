#include "reference/server/server.h"

#include "dunemere/instancenames.h"
#include "krn/osdep/mutex.h"
#include "reference/comm/listener.h"
#include "sorvik/rovocomm.h"
#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/store.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/server/configapplier.h"
#include "reference/server/datastore.h"
#include "reference/server/indexer.h"
#include "reference/server/indexplan.h"
#include "reference/server/indexrecords.h"
#include "reference/server/indexstatus.h"
#include "reference/server/propertyindex.h"
#include "reference/server/logonacceptor.h"
#include "reference/server/managerchannel.h"
#include "reference/server/managerrequests.h"
#include "reference/server/protocolsession.h"
#include "reference/server/servicetimeouts.h"

#include <QDir>
#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>
#include <QString>

#include <cstdio>
#include <list>
#include <optional>

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>
#include <stdexcept>
#include <thread>

namespace sorvik::server {

namespace {

// How often waiting threads look at the stop flag.
constexpr std::uint32_t kPollMilliseconds = 100;

using cv::vek::rovo::comm::FramedSocket;
using cv::vek::rovo::comm::kResultOk;
using cv::vek::rovo::comm::kResultTimeout;

std::unique_ptr<cv::krn::osdep::Mutex> Hold(std::u16string_view name, const char *what)
{
    auto mutex = std::make_unique<cv::krn::osdep::Mutex>(name);
    if (!mutex->TryAcquire())
        throw std::runtime_error(std::string("another server holds the ") + what);
    return mutex;
}

// Waits without a timer for the next bytes or the end of the server: a
// wait with a time-out costs a timer per request, which on a virtual
// machine is a good part of a round trip.
bool WaitForInput(int socket, int stopEvent)
{
    pollfd waits[2] = {{socket, POLLIN, 0}, {stopEvent, POLLIN, 0}};
    while (::poll(waits, 2, -1) < 0) {
        if (errno != EINTR)
            return false;
    }
    return waits[1].revents == 0;
}

void Serve(FramedSocket &socket, ServerContext &context, const ServiceTimeouts &timeouts, int stopEvent)
{
    ProtocolSession session(context);
    cv::krn::ByteBuffer record;
    while (WaitForInput(socket.Descriptor(), stopEvent)) {
        const std::uint32_t result = socket.Receive(record, 0);
        if (result == kResultTimeout)
            continue;
        if (result != kResultOk)
            return;
        const auto response = session.Handle(record.bytes());
        // A client that does not take its response within the browse and
        // connection time-out loses the connection.
        if (!response || socket.Send(response->bytes(), timeouts.BrowseMs()) != kResultOk)
            return;
    }
}

// One line per log-on on standard output, for whoever runs the server.
void AnnounceLogOn(const std::u16string &clientName)
{
    static std::mutex lock;
    std::lock_guard guard(lock);
    std::printf("logged on: %s\n", clientName.empty() ? "(anonymous)" : QString::fromStdU16String(clientName).toUtf8().constData());
    std::fflush(stdout);
}

void Announce(const char *format, long long value)
{
    std::printf(format, value);
    std::fflush(stdout);
}

void Report(const QString &text)
{
    std::fprintf(stderr, "Sorvik: %s\n", text.toLocal8Bit().constData());
}

// Where the server last kept the index of its Sorvik, so that it can follow
// an index location changed while it did not run.
QString LocationFile(const QString &storeFile)
{
    return storeFile + QStringLiteral("-indexlocation");
}

QString RememberedLocation(const QString &storeFile)
{
    QFile file(LocationFile(storeFile));
    if (!file.open(QIODevice::ReadOnly))
        return {};
    return QFile::decodeName(file.readAll().trimmed());
}

void RememberLocation(const QString &storeFile, const QString &folder)
{
    QFile file(LocationFile(storeFile));
    if (file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        file.write(QFile::encodeName(folder) + '\n');
}

bool SameFolder(const QString &a, const QString &b)
{
    return QDir::cleanPath(QDir(a).absolutePath()) == QDir::cleanPath(QDir(b).absolutePath());
}

// Opens the index in the committed folder; an index the server kept
// elsewhere before the folder was changed moves there first.
std::unique_ptr<IndexStatus> OpenIndex(const QString &storeFile, const QString &committedFolder)
{
    const QString remembered = RememberedLocation(storeFile);
    if (!remembered.isEmpty() && !SameFolder(remembered, committedFolder) &&
        QFile::exists(IndexStatus::FileIn(remembered)) && !QFile::exists(IndexStatus::FileIn(committedFolder))) {
        auto status = std::make_unique<IndexStatus>(remembered);
        try {
            status->MoveTo(committedFolder);
        } catch (const ref::Failure &failure) {
            Report(QStringLiteral("cannot move the index to %1: %2")
                       .arg(committedFolder, QString::fromStdU16String(failure.text)));
        }
        RememberLocation(storeFile, status->Folder());
        return status;
    }
    auto status = std::make_unique<IndexStatus>(committedFolder);
    RememberLocation(storeFile, status->Folder());
    return status;
}

} // namespace

struct Server::State
{
    ServerOptions options;
    QString storeFile;
    std::unique_ptr<cv::krn::osdep::Mutex> globalMutex;
    std::unique_ptr<cv::krn::osdep::Mutex> instanceMutex;
    std::unique_ptr<IndexStatus> status;
    // Declared in the order they are needed; they go in reverse, so the
    // threads of the channel, the applier and the indexer end before what
    // they use.
    ServiceTimeouts timeouts;
    std::unique_ptr<DataStore> dataStore;                 // null when the library cannot be loaded
    std::shared_ptr<const rovo::CatalogueInfo> catalogue; // the last one read
    std::unique_ptr<PropertyIndex> properties;
    std::unique_ptr<Indexer> indexer;
    std::unique_ptr<ConfigApplier> applier;
    std::unique_ptr<ManagerRequests> managerRequests;
    std::unique_ptr<ManagerChannel> manager;
    std::atomic<std::uint32_t> loggedOnUsers{0};
    AcceptorFactory makeKerberosAcceptor;
    cv::vek::rovo::comm::Listener listener;
    // Readable once the server stops, waking every connection's thread.
    int stopEvent = -1;

    ~State()
    {
        if (stopEvent >= 0)
            ::close(stopEvent);
    }

    void TakeUp(const CommittedConfiguration &committed);

private:
    bool DoRequest(const rovo::StoreRequest &request);
    void ChangeOptimization(const rovo::StoreRequest &request);
    void FollowIndexLocation(const QString &folder);
    const rovo::CatalogueInfo *Catalogue();
};

// What the server does with a configuration it takes up.
void Server::State::TakeUp(const CommittedConfiguration &committed)
{
    const rovo::Settings &settings = committed.configuration.settings;
    timeouts.TakeUp(settings.browseTimeout, settings.queryTimeout);
    bool indexAgain = false;
    for (const rovo::StoreRequest &request : committed.requests)
        indexAgain = DoRequest(request) || indexAgain;
    // An index that cannot move stays where it is and goes on indexing what
    // this configuration says; the waiting clients learn why.
    std::optional<ref::Failure> notMoved;
    try {
        FollowIndexLocation(settings.indexPath);
    } catch (const ref::Failure &failure) {
        notMoved = failure;
    }
    // Without a catalogue the server cannot tell what reads a file, and
    // leaves the index as it is rather than empty it.
    if (const rovo::CatalogueInfo *parselets = Catalogue())
        indexer->TakeUp(MakePlan(committed.configuration, *parselets), IndexerSettingsOf(settings), indexAgain);
    const std::int64_t lastRequest =
        committed.requests.empty() ? status->AppliedRequest() : committed.requests.back().id;
    status->RecordApplied(committed.generation, lastRequest);
    Announce("applied configuration %lld\n", committed.generation);
    if (notMoved)
        throw *notMoved;
}

// True when the request asks for indexing.
bool Server::State::DoRequest(const rovo::StoreRequest &request)
{
    if (request.kind == u"reset-index") {
        status->ResetIndex(request.argument == QString::number(cv::rovo::kResetIndexAndConfiguration));
        indexer->AbortPass();
        return true;
    }
    if (request.kind == u"start-indexing")
        return true;
    if (request.kind == u"reindex-parselet") {
        IndexRecords(*status).MarkForReading(request.argument);
        return true;
    }
    if (request.kind == manager::request::OptimizeProperty || request.kind == manager::request::UnoptimizeProperty)
        ChangeOptimization(request);
    // move-index: the index follows the committed index folder.
    return false;
}

void Server::State::ChangeOptimization(const rovo::StoreRequest &request)
{
    const QJsonObject change = QJsonDocument::fromJson(request.argument.toUtf8()).object();
    const auto level = LevelOfKey(change.value(manager::field::Level).toString());
    const QString name = change.value(manager::field::Property).toString();
    const auto state = manager::IntegerField(change, manager::field::State, 0, UINT16_MAX);
    const bool optimize = request.kind == manager::request::OptimizeProperty;
    if (!level || name.isEmpty() || (optimize && !state)) {
        Report(QStringLiteral("request %1 is not a change of an optimized property: %2").arg(request.id).arg(request.argument));
        return;
    }
    if (optimize)
        properties->Optimize(*level, name, std::uint32_t(*state));
    else
        properties->Unoptimize(*level, name);
}

void Server::State::FollowIndexLocation(const QString &folder)
{
    if (folder.isEmpty() || SameFolder(folder, status->Folder()))
        return;
    status->MoveTo(folder);
    RememberLocation(storeFile, status->Folder());
    std::printf("index moved to %s\n", QFile::encodeName(status->Folder()).constData());
    std::fflush(stdout);
}

// The catalogue as the data-store library has it now; when it cannot be
// read, the last one read, so that a passing failure does not empty the
// index; null when there has never been one.
const rovo::CatalogueInfo *Server::State::Catalogue()
{
    if (dataStore) {
        try {
            catalogue = dataStore->Catalogue();
        } catch (const ref::Failure &failure) {
            Report(QStringLiteral("cannot read the Parselet catalogue: %1").arg(QString::fromStdU16String(failure.text)));
        }
    }
    return catalogue.get();
}

namespace {

[[noreturn]] void Unusable(const char *what, const ref::Failure &failure)
{
    throw std::runtime_error(std::string(what) + ": " + QString::fromStdU16String(failure.text).toStdString());
}

} // namespace

Server::Server(ServerOptions options, AcceptorFactory makeKerberosAcceptor) : m_state(std::make_unique<State>())
{
    State &state = *m_state;
    state.options = std::move(options);
    state.makeKerberosAcceptor = std::move(makeKerberosAcceptor);
    const std::u16string &portName = state.options.portName;

    state.stopEvent = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (state.stopEvent < 0)
        throw std::runtime_error("cannot create an event");

    // The mutexes come first: clients decide by them whether a server runs.
    if (portName.empty())
        state.globalMutex = Hold(cv::vek::rovo::dunemere::kGlobalServerMutexName, "global server mutex");
    state.instanceMutex = Hold(cv::vek::rovo::dunemere::InstanceMutexName(portName), "instance mutex");

    // The Sorvik of this instance: the local one, or the one named like the port.
    state.storeFile = rovo::StoreFile(QString::fromStdU16String(portName));
    try {
        state.applier = std::make_unique<ConfigApplier>(
            state.storeFile, std::chrono::milliseconds(state.options.applyDelayMs));
    } catch (const ref::Failure &failure) {
        Unusable("cannot read the configuration", failure);
    }
    try {
        state.status = OpenIndex(state.storeFile, state.applier->CommittedSettings().indexPath);
    } catch (const ref::Failure &failure) {
        Unusable("cannot open the index status", failure);
    }
    try {
        state.dataStore = std::make_unique<DataStore>();
    } catch (const std::exception &failure) {
        Report(QStringLiteral("cannot index without the Parselet catalogue: %1").arg(QString::fromLocal8Bit(failure.what())));
    }
    state.properties = std::make_unique<PropertyIndex>(*state.status);
    std::optional<std::chrono::seconds> idleOverride;
    if (state.options.idleSeconds)
        idleOverride = std::chrono::seconds(*state.options.idleSeconds);
    state.indexer = std::make_unique<Indexer>(*state.status, idleOverride);
    try {
        state.applier->Start(state.status->AppliedRequest(),
                             [&state](const CommittedConfiguration &committed) { state.TakeUp(committed); });
    } catch (const ref::Failure &failure) {
        Unusable("cannot take up the configuration", failure);
    }
    state.indexer->Start();

    // The manager channel listens before the client service, so a client
    // that finds the service finds the index manager too.
    state.managerRequests = std::make_unique<ManagerRequests>(state.options, state.storeFile, *state.status,
                                                              *state.applier, state.timeouts, *state.indexer,
                                                              *state.properties);
    state.manager = std::make_unique<ManagerChannel>(portName, *state.managerRequests);
    state.manager->Start();

    if (portName.empty())
        state.listener.ListenLocal(u"VEK_INDEX_SERVICE", u"VEK_INDEX_SERVICE_SEARCH_BROWSE");
    else
        state.listener.ListenLocal(portName, u"VEK_INDEX_SERVICE_SERVER");
}

Server::~Server() = default;

void Server::Run(const std::atomic<bool> &stop)
{
    State &state = *m_state;
    ServerContext context{state.options, *state.status, state.loggedOnUsers, state.makeKerberosAcceptor,
                          &AnnounceLogOn};
    const ServiceTimeouts &timeouts = state.timeouts;

    struct Connection
    {
        std::unique_ptr<FramedSocket> socket;
        std::thread thread;
        std::atomic<bool> done{false};
    };
    std::list<Connection> connections;
    auto reapFinished = [&connections] {
        for (auto it = connections.begin(); it != connections.end();) {
            if (it->done.load()) {
                it->thread.join();
                it = connections.erase(it);
            } else {
                ++it;
            }
        }
    };

    while (!stop.load()) {
        auto socket = state.listener.Accept(kPollMilliseconds);
        reapFinished();
        if (!socket)
            continue;
        Connection &connection = connections.emplace_back();
        connection.socket = std::move(socket);
        connection.thread = std::thread([&connection, &context, &timeouts, stopEvent = state.stopEvent] {
            try {
                Serve(*connection.socket, context, timeouts, stopEvent);
            } catch (const std::exception &) {
                // Out of memory or a failing store: this client loses its
                // connection, the others keep theirs.
            }
            connection.socket->Close();
            connection.done.store(true);
        });
    }
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(state.stopEvent, &one, sizeof one);
    for (Connection &connection : connections)
        connection.thread.join();
    state.manager->Stop();
    state.applier->Stop();
    state.indexer->Stop();
    state.properties->Stop();
}

} // namespace sorvik::server

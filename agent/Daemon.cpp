// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Daemon.h"

#include <sys/signalfd.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <memory>
#include <system_error>

#include "access/DeviceMapperIf.h"
#include "access/ExternalEventAdaptor.h"
#include "access/ExternalFaultEventAdaptor.h"
#include "agent/BoardSource.h"
#include "agent/Collector.h"
#include "agent/InterfaceIndices.h"
#include "agent/InterfaceReader.h"
#include "agent/Log.h"
#include "agent/ModuleLoader.h"
#include "agent/Notifier.h"
#include "agent/ObjectTree.h"
#include "agent/Objects.h"
#include "agent/SnmpConfig.h"
#include "agent/SnmpHandler.h"
#include "agent/SnmpLoop.h"
#include "agent/StandardObjects.h"
#include "agent/StatusListener.h"
#include "agent/Wakeup.h"

namespace kvloamd {

namespace {

/// SIGTERM and SIGINT as a descriptor. They are blocked for the whole process: made before any
/// other thread.
class StopSignals {
  public:
    StopSignals() {
        sigemptyset(&m_signals);
        sigaddset(&m_signals, SIGTERM);
        sigaddset(&m_signals, SIGINT);
        pthread_sigmask(SIG_BLOCK, &m_signals, nullptr);
        m_descriptor = signalfd(-1, &m_signals, SFD_CLOEXEC | SFD_NONBLOCK);
        if (m_descriptor < 0) throw std::system_error(errno, std::generic_category(), "signalfd");
    }
    ~StopSignals() { close(m_descriptor); }
    StopSignals(StopSignals const&) = delete;
    StopSignals& operator=(StopSignals const&) = delete;

    int descriptor() const { return m_descriptor; }

    /// From now on such a signal ends the process at once, for whoever finds the stop too slow.
    void letThrough() const {
        signalfd_siginfo taken;
        while (read(m_descriptor, &taken, sizeof taken) > 0) {
        }
        pthread_sigmask(SIG_UNBLOCK, &m_signals, nullptr);
    }

  private:
    sigset_t m_signals{};
    int m_descriptor = -1;
};

/// What the library's threads may reach until the process ends. Never destroyed.
struct Boards {
    ReferenceCounter<BoardManager> manager{new BoardManager};
    Counters counters;
    BoardSource source{*manager.get()};
    StatusQueue queue{counters};
    StatusListener listener{*manager.get(), source, queue};
};

/// Makes the first calls of the library's singletons, which belong to one thread, and asks the
/// platform for its root object.
bool platformAnswers() {
    ReferenceTable::get_instance();
    DeviceMapperClient* const client = DeviceMapperIf::get_interface()->GetDMClient();
    long root = -1;
    int const result = client == nullptr ? -1 : client->GetRootObject(&root);
    if (result != 0) {
        log(LogLevel::Error, "the board platform does not answer: its device mapper gives no root "
                             "object (result " +
                                 std::to_string(result) + "); check that the platform runs");
        return false;
    }
    ExternalEventAdaptor::get_instance();
    ExternalFaultEventAdaptor::get_instance();
    return true;
}

std::vector<LoadedModule> loadModules(Options const& options) {
    std::vector<LoadedModule> modules;
    for (std::string const& name : options.modules)
        modules.emplace_back(name, options.moduleDirectory);
    return modules;
}

bool report(std::vector<std::string> const& faults) {
    for (std::string const& fault : faults)
        log(LogLevel::Error, fault);
    return faults.empty();
}

/// The SNMP library, from its start to its end.
class SnmpSession {
  public:
    explicit SnmpSession(Options const& options) : m_faults(startSnmp(options)) {}
    ~SnmpSession() { stopSnmp(); }
    SnmpSession(SnmpSession const&) = delete;
    SnmpSession& operator=(SnmpSession const&) = delete;

    std::vector<std::string> const& faults() const { return m_faults; }

  private:
    std::vector<std::string> m_faults;
};

/// Opens every address that `options` name.
bool listen(Options const& options) {
    bool open = true;
    for (std::string const& address : options.listen) {
        std::string const fault = SnmpLoop::listen(address);
        if (fault.empty()) continue;
        log(LogLevel::Error, fault);
        open = false;
    }
    return open;
}

/// Every module's factory is made before the first is attached: a bad module leaves nothing half
/// started.
void attachModules(std::vector<LoadedModule> const& modules, Boards& boards) {
    std::vector<ReferenceCounter<BoardFactory>> factories;
    factories.reserve(modules.size());
    for (LoadedModule const& module : modules)
        factories.push_back(module.createFactory());
    boards.manager->AddBoardStatusListener(&boards.listener);
    for (ReferenceCounter<BoardFactory> const& factory : factories)
        boards.manager->Attach(factory);
    for (LoadedModule const& module : modules)
        ServiceManager::GetInstance()->AddModule(module.name().c_str());
}

/// Has the listener tell of changes for a scope.
class ListeningScope {
  public:
    ListeningScope(StatusListener& listener, std::function<void()> changed) : m_listener(listener) {
        m_listener.start(std::move(changed));
    }
    ~ListeningScope() { m_listener.stop(); }
    ListeningScope(ListeningScope const&) = delete;
    ListeningScope& operator=(ListeningScope const&) = delete;

  private:
    StatusListener& m_listener;
};

/// A folder for a scope.
class TemporaryFolder {
  public:
    TemporaryFolder() {
        m_path = (std::filesystem::temp_directory_path() / "kvloamd-XXXXXX").string();
        if (mkdtemp(m_path.data()) == nullptr)
            throw std::system_error(errno, std::generic_category(), m_path);
    }
    ~TemporaryFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    TemporaryFolder(TemporaryFolder const&) = delete;
    TemporaryFolder& operator=(TemporaryFolder const&) = delete;

    std::string const& path() const { return m_path; }

  private:
    std::string m_path;
};

void serve(Options const& options, StopSignals const& stopSignals, Boards& boards,
           Clock::time_point started) {
    Wakeup wakeup;
    ServiceManager& services = *ServiceManager::GetInstance();
    KPXStatisticsTable& statistics = *KPXStatisticsTable::GetInstance();
    PlatformReader platform;
    InterfaceIndices indices(persistentDirectory() + "/ifindex.sqlite", options.interfaceBase);
    InterfaceReader interfaces(*boards.manager.get(), indices, started);
    Collector collector(
        [&](Snapshot& snapshot) {
            snapshot.boards = boards.source.read();
            snapshot.modules = readModules(services);
            snapshot.services = readServices(services);
            snapshot.platformService = readPlatformService(services);
            snapshot.processes = readProcesses(statistics);
            snapshot.records = platform.read(snapshot.boards);
            snapshot.interfaces = interfaces.read(snapshot.boards);
        },
        started, [&] { wakeup.wake(); });
    std::vector<Table const*> const allTables = tables();
    ObjectTree const tree(scalars(), allTables);
    SnmpHandler handler(tree, boards.counters, options.enterprise,
                        [&] { return collector.snapshot(); });
    if (!handler.serve(kObjectsPlace))
        throw std::runtime_error("the SNMP library does not let the agent serve its objects; check "
                                 "--enterprise-oid");
    std::vector<Table const*> const allStandardTables = standardTables();
    ObjectTree const standardTree(standardScalars(), allStandardTables);
    SnmpHandler standardHandler(standardTree, boards.counters, kStandardArc,
                                [&] { return collector.snapshot(); });
    for (Oid const& place : kStandardPlaces)
        if (!standardHandler.serve(place))
            throw std::runtime_error("the SNMP library does not let the agent serve the standard "
                                     "interface objects; check --enterprise-oid");
    Notifier notifier(boards.queue, options.enterprise);
    SnmpLoop loop;
    loop.watch(wakeup.descriptor(), [&] { wakeup.clear(); });
    loop.watch(stopSignals.descriptor(), [&] { loop.stop(); });
    loop.beforeSleep([&] { return notifier.announce(collector.newest()->begun); });
    ListeningScope const listening(boards.listener, [&] { collector.renew(); });
    Notifier::announceStart();
    log(LogLevel::Info, "serving " + std::to_string(collector.newest()->boards.size()) +
                            " boards on " + options.listen.front());
    loop.run();
    stopSignals.letThrough();
    log(LogLevel::Info, "stopping");
    boards.listener.stop();
    notifier.announceAll();
}

} // namespace

int runDaemon(Options const& options) {
    StopSignals const stopSignals;
    tzset();
    // The library's threads reach these until the process ends.
    static auto* const boards = new Boards;
    try {
        std::vector<LoadedModule> const modules = loadModules(options);
        if (modules.empty())
            log(LogLevel::Warning, "no board module is named, so there will be no boards; name one "
                                   "with --module");
        SnmpSession const snmp(options);
        if (!report(snmp.faults()) || !listen(options) || !platformAnswers()) return kExitFailure;
        Clock::time_point const started = Clock::now();
        attachModules(modules, *boards);
        serve(options, stopSignals, *boards, started);
        log(LogLevel::Info, "stopped");
    } catch (std::exception const& error) {
        log(LogLevel::Error, error.what());
        return kExitFailure;
    }
    return 0;
}

int checkConfiguration(Options const& options) {
    bool good = true;
    for (std::string const& name : options.modules) {
        try {
            LoadedModule(name, options.moduleDirectory);
        } catch (ModuleError const& error) {
            log(LogLevel::Error, error.what());
            good = false;
        }
    }
    // The SNMP library keeps its state as it goes; a check leaves no trace.
    TemporaryFolder const folder;
    Options withoutTrace = options;
    withoutTrace.persistentDirectory = folder.path();
    SnmpSession const snmp(withoutTrace);
    good = report(snmp.faults()) && good;
    if (good) log(LogLevel::Info, "the configuration is good");
    return good ? 0 : kExitFailure;
}

} // namespace kvloamd

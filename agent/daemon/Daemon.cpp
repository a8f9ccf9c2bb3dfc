// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Daemon.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <memory>
#include <new>
#include <optional>
#include <string_view>
#include <system_error>
#include <utility>

#include "access/ExternalFaultEventAdaptor.h"
#include "agent/alarms/AlarmEvents.h"
#include "agent/alarms/AlarmSources.h"
#include "agent/alarms/ThresholdWatch.h"
#include "agent/daemon/AlarmReport.h"
#include "agent/daemon/AlarmThread.h"
#include "agent/daemon/ConfigCheck.h"
#include "agent/daemon/FrontChoice.h"
#include "agent/daemon/HttpSide.h"
#include "agent/daemon/InterruptibleStart.h"
#include "agent/daemon/ModuleLoader.h"
#include "agent/daemon/Platform.h"
#include "agent/daemon/ServiceNotice.h"
#include "agent/daemon/Signals.h"
#include "agent/daemon/StaleSnapshot.h"
#include "agent/fronts/Wakeup.h"
#include "agent/log/Log.h"
#include "agent/notifications/CallWatch.h"
#include "agent/notifications/EntityNotices.h"
#include "agent/notifications/FaultListener.h"
#include "agent/notifications/LineListener.h"
#include "agent/notifications/LinkWatch.h"
#include "agent/notifications/Notifier.h"
#include "agent/notifications/StatusListener.h"
#include "agent/notifications/SubjectObjects.h"
#include "agent/objects/ObjectTree.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "agent/readers/BoardSource.h"
#include "agent/readers/BoardTurns.h"
#include "agent/readers/Collector.h"
#include "agent/readers/EntityReader.h"
#include "agent/readers/HostInterfaces.h"
#include "agent/readers/InterfaceReader.h"
#include "agent/readers/KeptSettings.h"
#include "agent/readers/PlatformReader.h"
#include "agent/readers/ProcessReader.h"
#include "agent/readers/ResourceReader.h"
#include "agent/readers/ServiceReader.h"
#include "agent/readers/StableIndices.h"
#include "agent/readers/StateDirectory.h"
#include "agent/readers/StateFile.h"
#include "agent/readers/StoreReader.h"
#include "agent/readers/Whereabouts.h"
#include "platform/ActionScheduler_pthread.h"

namespace kvloamd {

namespace {

/// How long a stop waits for pending notifications.
constexpr std::chrono::seconds kFlushTime{1};

/// The lowest entPhysicalIndex: that of the chassis.
constexpr std::uint32_t kFirstEntity = 1;

/// Everything that the library's threads may access until the process ends. Never destroyed.
struct Boards {
    explicit Boards(Oid const& enterprise)
        : alarmReport(enterprise),
          listener(*manager.get(), source, queue, counters, enterprise),
          faultListener(*manager.get(), faults, queue, enterprise) {
        queue.observeDrops([this](Notification const& notification) {
            Notification dropped = notification;
            alarmReport.record(dropped, true);
        });
        listener.observe([this](int index, Board& board, BoardStatusEnum status) {
            turns.note(static_cast<std::uint32_t>(index));
            alarmEvents.boardStatus(index, board, status);
        });
        faultListener.observe([this](FaultChange const& change) {
            alarmEvents.fault(change.raised, change.boardIndex, change.serialNumber, change.value);
        });
        lines.observe(
            [this](std::uint32_t ifIndex, int status) { alarmEvents.lineStatus(ifIndex, status); });
    }

    bool const hasStore = storeIsConfigured();
    ReferenceCounter<BoardManager> manager{new BoardManager};
    Counters counters;
    Settings settings;
    BoardTurns turns;
    BoardSource source{*manager.get(), &turns};
    NotificationQueue queue{counters};
    AlarmReport alarmReport;
    AlarmList alarms{{}, [this](AlarmEvent event, Alarm const& alarm) {
                         return alarmReport.report(event, alarm);
                     }};
    AlarmEvents alarmEvents{alarms, [this](std::string const& text, std::string const& board) {
                                alarmReport.note(JournalEvent::BoardStatus, text, board);
                            }};
    FaultLog faults;
    StatusListener listener;
    LineListener lines{*manager.get(), settings, queue, counters};
    FaultListener faultListener;
};

/// Creates the library's scheduler, which ticks the history of every line. Returns whether the
/// system gave it a thread.
bool schedulerRuns() {
    auto const* const thread =
        dynamic_cast<KVLThread_pthread*>(ActionScheduler_pthread::GetScheduler());
    if (thread == nullptr || thread->HasThread()) return true;
    log(LogLevel::Error, "the system refuses a thread for the scheduler of the lines' history; "
                         "check the limits on processes, threads and memory");
    return false;
}

std::vector<LoadedModule> loadModules(Options const& options) {
    std::vector<LoadedModule> modules;
    for (std::string const& name : options.modules)
        modules.emplace_back(name, options.moduleDirectory);
    return modules;
}

/// Creates every factory before it attaches the first one, so that a bad module leaves nothing half
/// started.
void attachModules(std::vector<LoadedModule> const& modules, Boards& boards) {
    std::vector<ReferenceCounter<BoardFactory>> factories;
    factories.reserve(modules.size());
    for (LoadedModule const& module : modules)
        factories.push_back(module.createFactory());
    boards.manager->AddBoardStatusListener(&boards.listener);
    boards.manager->AddBoardStatusListener(&boards.faultListener);
    ExternalFaultEventAdaptor::get_instance()->AddExternalFaultEventListener(&boards.faultListener);
    for (ReferenceCounter<BoardFactory> const& factory : factories)
        boards.manager->Attach(factory);
    for (LoadedModule const& module : modules)
        ServiceManager::GetInstance()->AddModule(module.name().c_str());
}

/// A scope during which the listeners report changes.
class ListeningScope {
  public:
    ListeningScope(Boards& boards, std::function<void()> const& changed) : m_boards(boards) {
        m_boards.listener.start(changed);
        m_boards.faultListener.start(changed);
        m_boards.lines.start(changed);
    }
    ~ListeningScope() { stop(); }
    ListeningScope(ListeningScope const&) = delete;
    ListeningScope& operator=(ListeningScope const&) = delete;

    void stop() {
        m_boards.listener.stop();
        m_boards.faultListener.stop();
        m_boards.lines.stop();
    }

  private:
    Boards& m_boards;
};

using Deadline = std::optional<Clock::time_point>;

Deadline earliest(Deadline const& one, Deadline const& other) {
    return one && other ? std::min(*one, *other) : one ? one : other;
}

/// Reads the options again and applies those that can change while the agent runs. The others need
/// a restart.
void reloadOptions(Options const& started, ReadOptions const& readAgain, Boards& boards,
                   ThresholdWatch& thresholds) {
    auto const read = readAgain();
    auto const* const options = std::get_if<Options>(&read);
    if (options == nullptr) {
        log(LogLevel::Error, std::get<Exit>(read).text + "; keeping the previous configuration");
        return;
    }
    setLogLevel(options->logLevel);
    boards.alarms.apply(options->alarmPolicies, Instant::now());
    thresholds.configure(options->typeLimits);
    Options now = *options;
    now.logLevel = started.logLevel;
    now.alarmPolicies = started.alarmPolicies;
    now.typeLimits = started.typeLimits;
    log(LogLevel::Info, now == started
                            ? "the configuration has been read again"
                            : "the configuration has been read again; changes other than the log "
                              "level, alarms and thresholds take effect at the next start");
}

/// Reads the SNMP configuration again, of which a check has found `fault`.
void reloadSnmp(Front& front, std::string const& fault) {
    if (!fault.empty()) {
        log(LogLevel::Error, fault + "; keeping the previous SNMP configuration");
        return;
    }
    std::vector<std::string> const faults = front.readConfigurationAgain();
    // The file has changed since the check.
    for (std::string const& each : faults)
        log(LogLevel::Error, each);
    if (faults.empty())
        log(LogLevel::Info, "the SNMP configuration (communities, users, views, receivers) has "
                            "been read again");
}

/// Flushes pending notifications, waiting at most `kFlushTime`.
void flushNotifications(Notifier& notifier, NotificationQueue& queue, Front& front) {
    front.beforeSleep([&]() -> std::optional<Clock::time_point> {
        if (notifier.sendAll()) front.stop();
        return std::nullopt;
    });
    front.run(Clock::now() + kFlushTime);
    if (std::size_t const left = queue.size(); left > 0)
        log(LogLevel::Warning, "notifications not sent before the stop: " + std::to_string(left));
}

void serve(Options const& options, ReadOptions const& readAgain, Front& front, HttpSide& http,
           Signals const& signals, InterruptibleStart& start, Boards& boards) {
    Clock::time_point const started = boards.counters.started;
    Wakeup wakeup;
    ServiceManager& services = *ServiceManager::GetInstance();
    KPXStatisticsTable& statistics = *KPXStatisticsTable::GetInstance();
    PlatformReader platform(PlatformReader::kMaxAge, boards.hasStore);
    std::string const directory = persistentDirectory(snmpFiles(options));
    StateFile interfaceFile(directory + "/ifindex.sqlite", "interfaces");
    StableIndices indices(interfaceFile, options.interfaceBase);
    KeptSettings keptSettings(interfaceFile, indices, boards.settings);
    interfaceFile.open();
    HostInterfaces host;
    if (!options.agentx.empty()) indices.skipTo(host.highest() + 1);
    InterfaceReader interfaces(*boards.manager.get(), indices, started, &boards.turns);
    ResourceReader resources(*boards.manager.get(), &boards.turns);
    StateFile entityFile(directory + "/entity.sqlite", "physical entities");
    StableIndices entityIndices(entityFile, kFirstEntity);
    KeptSettings keptEntitySettings(entityFile, entityIndices, boards.settings,
                                    SettingIndex::Entity);
    entityFile.open();
    EntityReader entities(entityIndices, boards.settings, started,
                          [] { return std::time(nullptr); });
    SettingsWatch settingsWatch(boards.settings, boards.alarmReport);
    LinkWatch links(boards.settings, boards.queue, boards.counters);
    CallWatch calls(boards.settings, boards.queue, boards.counters);
    AlarmTables alarmTables(boards.alarms, options.enterprise, started);
    StaleSnapshot staleSnapshot(alarmTables);
    ThresholdWatch thresholds(boards.alarms, boards.settings, options.typeLimits);
    Collector collector(
        [&](Snapshot& snapshot) {
            settingsWatch.update();
            keptSettings.save();
            keptEntitySettings.save();
            snapshot.boards = boards.source.read();
            snapshot.modules = readModules(services);
            snapshot.services = readServices(services);
            snapshot.platformService = readPlatformService(services);
            snapshot.processes = readProcesses(statistics);
            snapshot.records = platform.read(snapshot.boards);
            snapshot.platformSilent = !platform.mapperAnswers();
            snapshot.storeUnreadable = !platform.storeIsReadable();
            boards.lines.listen(snapshot.boards, interfaces.changeTimes());
            snapshot.interfaces = interfaces.read(snapshot.boards);
            // After the interfaces, which tell which lines and channels have changed.
            snapshot.resources = resources.read(snapshot.boards);
            boards.faults.compare(shownLineFaults(snapshot.interfaces), Clock::now());
            snapshot.faults = boards.faults.read(started);
            std::vector<PlacedLine> const& lines = interfaces.lines();
            boards.lines.place(lines);
            applySettings(boards.settings, lines);
            links.update(snapshot.interfaces.interfaces, snapshot.begun);
            calls.update(snapshot.interfaces.bearers, snapshot.begun);
            thresholds.update(snapshot, lines);
            boards.alarmEvents.update(snapshot);
            snapshot.alarms = alarmTables.rows();
            snapshot.notifications =
                boards.alarmReport.notifications().rows(started, std::chrono::system_clock::now());
            snapshot.entities = entities.read(snapshot);
            noteWhereabouts(snapshot);
            if (!options.agentx.empty())
                snapshot.interfaceConflicts =
                    host.conflicts(snapshot.interfaces.interfaces, snapshot.begun);
            snapshot.persistence = worst(interfaceFile.state(), entityFile.state());
        },
        started, [&] { wakeup.wake(); });
    std::vector<Table const*> const allTables = tables();
    ObjectTree const tree(scalars(), allTables);
    std::vector<Table const*> const allStandardTables = standardTables();
    ObjectTree const standardTree(standardScalars(), allStandardTables);
    std::vector<ServedTree> const trees{
        {tree, options.enterprise, {{kObjectsPlace, "KVL-OAM-MIB"}}},
        {standardTree, kStandardArc, {kStandardPlaces.begin(), kStandardPlaces.end()}}};
    front.serve({trees, boards.counters,
                 [&] {
                     ++boards.counters.requests;
                     return staleSnapshot.of(collector.snapshot(), Clock::now());
                 },
                 [&] { return collector.newest(); }, boards.settings,
                 capabilities(options.enterprise, KVLOAM_VERSION)});
    std::vector<Table const*> everyTable = allTables;
    everyTable.insert(everyTable.end(), allStandardTables.begin(), allStandardTables.end());
    StaleSnapshot staleForHttp(alarmTables);
    Journal const& journal = boards.alarmReport.journal();
    HttpScope const httpScope(
        http, {{std::move(everyTable), {scalars(), standardScalars()}},
               boards.counters,
               boards.settings,
               [&] { return staleForHttp.of(collector.snapshot(), Clock::now()); },
               [&](JournalQuery const& query) {
                   return query.after ? journal.entriesAfter(*query.after, query.limit)
                                      : journal.newestEntries(query.limit);
               },
               [&] { return journal.newest(); }});
    Notifier notifier(boards.queue, front.notifications(), [&](Notification& notification) {
        auto const snapshot = collector.newest();
        nameSubject(notification, trees, {*snapshot, boards.counters, &boards.settings});
        boards.alarmReport.record(notification, false);
        collector.renew(); // the snapshot shows the log of notifications
    });
    EntityNotices entityNotices(boards.queue);
    AlarmClock alarmClock(boards.alarms, boards.alarmReport, boards.counters,
                          [&] { collector.renew(); });
    AlarmThread alarmThread(
        [&] { return alarmClock.advance(*collector.newest(), Instant::now()); });
    ServiceNotice notice;
    std::size_t const boardCount = collector.newest()->boards.size();
    std::string const serving = "serving " + std::to_string(boardCount) +
                                (boardCount == 1 ? " board " : " boards ") + front.place();
    front.watch(wakeup.descriptor(), [&] {
        wakeup.clear();
        alarmThread.wake();
    });
    ConfigCheck configCheck(options);
    front.watch(signals.descriptor(), [&] {
        while (auto const signal = signals.next()) {
            if (*signal == Signal::Stop) return front.stop();
            notice.reloading();
            reloadOptions(options, readAgain, boards, thresholds);
            collector.renew();
            boards.alarmReport.note(JournalEvent::Configuration,
                                    "the configuration was read again");
            http.readTokenAgain();
            if (options.agentx.empty())
                configCheck.start();
            else
                notice.ready(serving);
        }
    });
    front.watch(configCheck.descriptor(), [&] {
        auto const fault = configCheck.take();
        if (!fault) return;
        reloadSnmp(front, *fault);
        notice.ready(serving);
    });
    front.beforeSleep([&] {
        if (boards.settings.hasUnsaved()) collector.renew();
        auto const nextEntityNotice = entityNotices.update(collector.newest(), Clock::now());
        auto const nextNotification = notifier.send(collector.newest()->begun);
        boards.counters.events = boards.alarmReport.counts().last;
        return earliest(nextEntityNotice, earliest(nextNotification, notice.beat()));
    });
    ListeningScope listening(boards, [&] {
        collector.renew();
        alarmThread.wake();
    });
    thresholds.start();
    start.end();
    log(LogLevel::Info, serving);
    notice.ready(serving);
    alarmThread.wake();
    front.run();
    http.stop();
    signals.letStopThrough();
    notice.stopping();
    log(LogLevel::Info, "stopping");
    listening.stop();
    entityNotices.finish();
    flushNotifications(notifier, boards.queue, front);
}

/// Logs that the system refused `what` during `step`.
void logLack(std::string_view what, std::string_view step) {
    log(LogLevel::Error, "the system refused " + std::string(what) + " while " + std::string(step) +
                             "; check the limits on processes, threads and memory");
}

} // namespace

int runDaemon(Options const& options, ReadOptions const& readAgain) {
    Signals const signals;
    tzset();
    // The library's threads access these until the process ends.
    static auto* const boards = new Boards(options.enterprise);
    std::string_view step = "starting";
    try {
        InterruptibleStart start(signals);
        step = "loading the board modules";
        std::vector<LoadedModule> const modules = loadModules(options);
        if (modules.empty())
            log(LogLevel::Warning,
                "no board module is configured, so there will be no boards; name one "
                "with --module");
        step = "opening the SNMP side";
        std::unique_ptr<Front> const front = makeFront(options);
        SnmpFiles const files = snmpFiles(options);
        std::string const directory = persistentDirectory(files);
        // Before anything in it is read.
        std::optional<StateDirectory> reserved(std::in_place, directory);
        if (!front->open()) return kExitFailure;
        // The SNMP configuration may name another one.
        if (persistentDirectory(files) != directory) reserved.emplace(persistentDirectory(files));
        boards->alarms.apply(options.alarmPolicies, Instant::now());
        boards->alarms.restore(boards->alarmReport.open(persistentDirectory(files)),
                               Instant::now());
        step = "opening the HTTP side";
        HttpSide http(options);
        // The master announces its own start.
        if (options.agentx.empty()) boards->queue.push(startNotification());
        step = "connecting to the board platform";
        if (!schedulerRuns() || !platformAnswers()) return kExitFailure;
        boards->counters.started = Clock::now();
        step = "reading the boards";
        attachModules(modules, *boards);
        step = "serving";
        serve(options, readAgain, *front, http, signals, start, *boards);
        boards->alarmReport.close(boards->alarms.active());
        log(LogLevel::Info, "stopped");
    } catch (std::bad_alloc const&) {
        logLack("memory", step);
        return kExitFailure;
    } catch (std::system_error const& error) {
        if (error.code() == std::errc::resource_unavailable_try_again)
            logLack("a thread", step);
        else
            log(LogLevel::Error, error.what());
        return kExitFailure;
    } catch (std::exception const& error) {
        log(LogLevel::Error, error.what());
        return kExitFailure;
    }
    return 0;
}

} // namespace kvloamd

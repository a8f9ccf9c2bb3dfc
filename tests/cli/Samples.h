// SPDX-License-Identifier: BSD-2-Clause
// Answers of an agent with one board that works, one that has failed, and two lines.
#pragma once

#include <string>

namespace samples {

inline std::string const kEnvelope =
    R"("snapshot":4711,"time":"2026-11-22T17:20:03.250Z","ageSeconds":0.4)";

inline std::string answer(std::string const& rest) {
    return "{" + kEnvelope + "," + rest + "}";
}

inline std::string const kGoodBoard =
    R"({"boardIndex":1,"status":"started","secondaryStatus":"none","name":"NX5-T1","model":"NX5-T1",)"
    R"("family":"NX5","firmwareVersion":"4.2","serialNumber":"NX50001","logicalId":1,"errorMessage":"",)"
    R"("changeDate":"2026-11-22T08:15:00Z","irq":null,"shelfId":1,"pciSlotNumber":4})";
inline std::string const kFailedBoard =
    R"({"boardIndex":2,"status":"started","secondaryStatus":"failed","name":"Z7-E1","model":"Z7-E1",)"
    R"("family":"Z7","firmwareVersion":"1.0","serialNumber":"Z70002","errorMessage":"does not answer",)"
    R"("changeDate":"2026-11-22T17:19:00Z","shelfId":1,"pciSlotNumber":5})";
inline std::string const kBoards = answer("\"boards\":[" + kGoodBoard + "," + kFailedBoard + "]");

inline std::string const kCounts =
    R"({"es":3,"ses":1,"sefs":0,"uas":0,"css":0,"pcv":12,"les":0,"bes":0,"dm":0,"lcv":0})";
inline std::string line(std::string const& name, int ifIndex, std::string const& status) {
    return R"({"name":")" + name + R"(","ifIndex":)" + std::to_string(ifIndex) +
           R"(,"board":"NX50001","boardIndex":1,"operStatus":"up","timeElapsed":412,)"
           R"("validIntervals":96,"lineType":"dsx1ESF","lineCoding":"dsx1B8ZS",)"
           R"("circuitIdentifier":"","lineStatus":[")" +
           status + R"("],"lineStatusLastChangeSeconds":1234.5,"current":)" + kCounts +
           ",\"total\":" + kCounts;
}
inline std::string const kLines =
    answer("\"lines\":[" + line("nx5-trunk-1", 1000, "dsx1LossOfSignal") + "}," +
           line("nx5-trunk-2", 1001, "dsx1NoAlarm") + "}]");
/// Its intervals: 1 with three errored seconds, 2 without data, 4 with none; no others.
inline std::string const kLine = answer(
    "\"line\":" + line("nx5-trunk-1", 1000, "dsx1LossOfSignal") +
    R"(,"intervals":[)"
    R"({"number":1,"start":"2026-11-22T17:00:00Z","validData":true,"es":3,"ses":2,"uas":0,"pcv":7},)"
    R"({"number":2,"start":"2026-11-22T16:45:00Z","validData":false,"es":null,"ses":null},)"
    R"({"number":4,"start":"2026-11-22T16:15:00Z","validData":true,"es":0,"ses":0,"uas":0}]})");

inline std::string const kAlarms = answer(
    R"("alarms":[{"number":1,"kind":"dsx1RcvFarEndLOF","severity":"minor","board":"NX50001",)"
    R"("resource":"board NX50001, T1 line nx5-trunk-2","date":"2026-11-22T17:00:00Z","times":1,)"
    R"("text":"the far end receives no frames","state":"active"},)"
    R"({"number":2,"kind":"boardFailed","severity":"critical","board":"Z70002",)"
    R"("resource":"board Z70002","date":"2026-11-22T17:19:00Z","times":2,)"
    R"("text":"the board has failed","state":"active"}])");
inline std::string const kNoAlarms = answer(R"("alarms":[])");

inline std::string const kHealth =
    answer(R"("health":{"host":"gw1","agentStarted":"2026-11-22T08:15:00Z","agentVersion":"0.1.0",)"
           R"("agentUpTimeSeconds":7300.5,"notificationsDropped":0,"boardCount":2,"lineCount":2,)"
           R"("agentFront":"standAlone","masterState":null,"persistence":"kept"})");

inline std::string const kJournal = answer(
    R"("entries":[{"number":7,"date":"2026-11-22T17:00:00Z","event":"agentStarted","text":"started",)"
    R"("board":null,"severity":null},)"
    R"({"number":8,"date":"2026-11-22T17:19:00Z","event":"alarmRaised","severity":"critical",)"
    R"("kind":"boardFailed","resource":"board Z70002","board":"Z70002",)"
    R"("text":"alarm raised: critical boardFailed on board Z70002: the board has failed"}])");

} // namespace samples

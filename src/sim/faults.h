#pragma once
// Faults the simulated bench can be told to show, from tests or from the command line.

#include <map>
#include <set>
#include <string>
#include <vector>

namespace zp::sim {

struct AnalyzerFault {
    std::string
        operation;  // "Object.operation" as written in the I/O trace, e.g. "Channel.setIfBandwidth"
    std::string description;  // e.g. "+143 Setting conflict" (skippable) or "-200 Execution error"
    int remaining = -1;       // how many calls fail; -1 = every call
};

struct SimFaults {
    std::vector<AnalyzerFault> analyzer;
    std::set<int> silentGenerators;  // do not answer "*IDN?" (the read times out)
    std::map<int, std::string>
        generatorErrors;              // queued error entry, e.g. -222,"Data out of range"
    std::set<int> timeoutGenerators;  // every read times out
    bool malformedData = false;       // "CALC32:DATA? SDATA" answers a broken block

    // Parses one command-line fault: "analyzer:OP=DESCRIPTION", "noidn:ADDR",
    // "generror:ADDR=ENTRY", "timeout:ADDR", "baddata". Throws std::invalid_argument with a
    // message that names the accepted forms.
    void add(const std::string& fault);
};

}  // namespace zp::sim

#pragma once
// Real generator transports, chosen by VISA-style resource text:
//   TCPIP0::host::port::SOCKET      raw SCPI socket (host may be an IPv6 address in brackets)
//   TCPIP0::gateway::gpib0,N::INSTR VXI-11 through a LAN/GPIB gateway (liblxi)
//   GPIB0::N::INSTR                 local GPIB board through the driver library loaded at run time

#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "instruments/instrument_bus.h"

namespace zp {

class IoTrace;

// GPIB address -> resource text.
using BusResources = std::map<int, std::string>;

// Parses "11=TCPIP0::127.0.0.1::5025::SOCKET,12=GPIB0::12::INSTR" (entries separated by commas or
// blanks). Throws std::invalid_argument naming the entry and what was expected for malformed text.
BusResources parseBusResources(std::string_view text);

// A bus whose openDevice(0, N, ...) reaches the resource given for address N. Addresses without a
// resource fail at openDevice with an InstrumentError naming the address. Every text is written to
// the trace when one is given.
std::unique_ptr<InstrumentBus> makeTransportBus(const BusResources& resources, IoTrace* trace);

}  // namespace zp

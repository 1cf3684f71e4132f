#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "tarn/mm/Reader.h"
#include "tarn/mm/Snapshot.h"
#include "tarn/mm/Value.h"

// From ModemManager's dictionaries to the checked values of Snapshot.h. Each function reads
// only its arguments; what it drops is written to `problems`.
namespace tarn::mm {

// A cell of GetCellInfo; empty for a cell type that the records have no place for (CDMA,
// TD-SCDMA, 5G NR) or a cell without its mandatory "cell-type" and "serving".
std::optional<Cell> readCell(const Dict& cell, std::string where, Problems& problems);

LteSignal readLteSignal(const Dict& lte, Problems& problems);
UmtsSignal readUmtsSignal(const Dict& umts, Problems& problems);
GsmSignal readGsmSignal(const Dict& gsm, Problems& problems);

// From the properties of the Modem and Modem3gpp interfaces.
Registration readRegistration(const Dict& modem, const Dict& modem3gpp, Problems& problems);

// The Bearer interface's properties; empty when the bearer is not connected.
std::optional<Bearer> readBearer(const Dict& bearer, std::string where, Problems& problems);

Sim readSim(const Dict& sim, Problems& problems);

// "21034" or "310410": three digits of MCC, then two or three of MNC.
std::optional<Plmn> parsePlmn(std::string_view digits);

}  // namespace tarn::mm

#pragma once

#include <array>
#include <cstdint>

// The metric IDs a baseband delivers: 0x3C in bits 16 to 23, the record's tag below.
namespace tarn::sim::metric_id {

inline constexpr std::uint32_t kLteRrcState = 0x3C4E04;
inline constexpr std::uint32_t kLteCdrxConfig = 0x3C4E18;
inline constexpr std::uint32_t kLteRadioLinkFailure = 0x3C4E25;
inline constexpr std::uint32_t kLteServingCellInfo = 0x3C40C2;
inline constexpr std::uint32_t kLteSelReselInfo = 0x3CD30E;
inline constexpr std::uint32_t kLteServingCellMeas = 0x3CD301;
inline constexpr std::uint32_t kLteTxPower = 0x3CD302;
inline constexpr std::uint32_t kLteRsrpRsrqSinr = 0x3C4F6A;
inline constexpr std::uint32_t kLteComponentCarriers = 0x3CD30B;
inline constexpr std::uint32_t kLteCaStatus = 0x3CD313;
inline constexpr std::uint32_t kLteSecondaryCellMeas = 0x3CD317;
inline constexpr std::uint32_t kLteInterRatMeas = 0x3CD310;
inline constexpr std::uint32_t kLteNeighbourMeas = 0x3CD30F;
inline constexpr std::uint32_t kUmtsRrcState = 0x3CD112;
inline constexpr std::uint32_t kUmtsRrcConfig = 0x3CD113;
inline constexpr std::uint32_t kUmtsServingCellInfo = 0x3C300C;
inline constexpr std::uint32_t kUmtsServingCellMeas = 0x3CD102;
inline constexpr std::uint32_t kUmtsTxPower = 0x3CD103;
inline constexpr std::uint32_t kUmtsSelReselInfo = 0x3CD104;
inline constexpr std::uint32_t kUmtsNeighbourMeas = 0x3CD105;
inline constexpr std::uint32_t kGsmServingCellInfo = 0x3C2E0C;
inline constexpr std::uint32_t kGsmIdleConfig = 0x3CD001;
inline constexpr std::uint32_t kGsmIdleServingMeas = 0x3CD002;
inline constexpr std::uint32_t kGsmCsRfMeas = 0x3CD003;
inline constexpr std::uint32_t kGsmNeighbourMeas = 0x3CD009;
inline constexpr std::uint32_t kGsmGprsConfig = 0x3CD00C;
inline constexpr std::uint32_t kMmCommonInfo = 0x3CD509;
inline constexpr std::uint32_t kMmContext = 0x3CD50A;
inline constexpr std::uint32_t kGmmContext = 0x3CD50B;
inline constexpr std::uint32_t kEmmContext = 0x3CD50C;
inline constexpr std::uint32_t kActiveBearers = 0x3CD50D;
inline constexpr std::uint32_t kSimFiles = 0x3C0013;

// Every ID the simulator produces.
inline constexpr std::array<std::uint32_t, 32> kAll = {
    kLteRrcState,          kLteCdrxConfig,      kLteRadioLinkFailure,  kLteServingCellInfo,
    kLteSelReselInfo,      kLteServingCellMeas, kLteTxPower,           kLteRsrpRsrqSinr,
    kLteComponentCarriers, kLteCaStatus,        kLteSecondaryCellMeas, kLteInterRatMeas,
    kLteNeighbourMeas,     kUmtsRrcState,       kUmtsRrcConfig,        kUmtsServingCellInfo,
    kUmtsServingCellMeas,  kUmtsTxPower,        kUmtsSelReselInfo,     kUmtsNeighbourMeas,
    kGsmServingCellInfo,   kGsmIdleConfig,      kGsmIdleServingMeas,   kGsmCsRfMeas,
    kGsmNeighbourMeas,     kGsmGprsConfig,      kMmCommonInfo,         kMmContext,
    kGmmContext,           kEmmContext,         kActiveBearers,        kSimFiles,
};

}  // namespace tarn::sim::metric_id

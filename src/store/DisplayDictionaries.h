#pragma once

#include <array>
#include <cstddef>
#include <string_view>

// The store's 31 display dictionaries, in declaration order. Each entry is the member's name
// without "my" and "Dict": LTERRCState stands for myLTERRCStateDict.
#define NORVO_DISPLAY_DICTIONARIES(X) \
  X(LTERRCState)                      \
  X(LTECDRXConfig)                    \
  X(LTESCellInfo)                     \
  X(LTESCellMeas)                     \
  X(LTESelResel)                      \
  X(LTERsrpRsrqSinr)                  \
  X(LTECompCarr)                      \
  X(LTETxPower)                       \
  X(LTEInterRatMeas)                  \
  X(LTEIntraRatMeas)                  \
  X(LTECAStatus)                      \
  X(LTESecondaryCellMeas)             \
  X(LTEEMMContext)                    \
  X(CellularMMCommonInfo)             \
  X(CellularActiveBearer)             \
  X(GMMContext)                       \
  X(MMContext)                        \
  X(UMTSRRCState)                     \
  X(UMTSRRCConfig)                    \
  X(UMTSCellInfo)                     \
  X(UMTSCellMeas)                     \
  X(UMTSTxPower)                      \
  X(UMTSSelResel)                     \
  X(UMTSNbrMeas)                      \
  X(GSMScellInfo)                     \
  X(GSMIdleConfigInfo)                \
  X(GSMIdleScellMeas)                 \
  X(GSMConnRfMeas)                    \
  X(GSMNbrMeas)                       \
  X(GSMGPRSConfig)                    \
  X(SIMFileInfo)

namespace store {

enum class DisplayDictionary : std::size_t {
#define NORVO_ENUMERATOR(name) name,
  NORVO_DISPLAY_DICTIONARIES(NORVO_ENUMERATOR)
#undef NORVO_ENUMERATOR
};

inline constexpr std::array kDisplayDictionaryNames = {
#define NORVO_MEMBER_NAME(name) std::string_view("my" #name "Dict"),
    NORVO_DISPLAY_DICTIONARIES(NORVO_MEMBER_NAME)
#undef NORVO_MEMBER_NAME
};

inline constexpr std::size_t kDisplayDictionaryCount = kDisplayDictionaryNames.size();
static_assert(kDisplayDictionaryCount == 31);

// The member name, e.g. "myLTECAStatusDict".
constexpr std::string_view memberName(DisplayDictionary dictionary) {
  return kDisplayDictionaryNames[static_cast<std::size_t>(dictionary)];
}

}  // namespace store

#include "screens/NorvoViewItems.h"

NorvoViewItems::NorvoViewItems()
    : launchViewItemNames_{"Device Info", "LTE", "UMTS", "GSM"},
      firstLevelViewItems_{
          {"Device Info", {"IMSI", "IMEISV", "SIM Files"}},
          {"LTE",
           {"NAS", "RRC State", "Serving Cell Info", "Serving Cell Meas", "Tx Power",
            "Sel Resel Parameters", "EUTRA Neighbor Info", "C-DRX", "LTE Neighbor Cell Meas",
            "UMTS Neighbor Cell Meas", "GSM Neighbor Cell Meas", "CA Status", "Secondary Cell Meas",
            "Active Bearers"}},
          {"UMTS",
           {"NAS GMM", "NAS MM", "RRC State", "RRC Configuration", "Serving Cell Info",
            "Serving Cell Meas", "Tx Power", "Sel Resel Parameters", "EUTRA Neighbor Info",
            "UTRA Neighbor Info", "GSM Neighbor Info", "LTE Neighbor Cell Meas",
            "UMTS Neighbor Cell Meas", "GSM Neighbor Cell Meas", "Active Bearers"}},
          // "GSM GPRS Config" carries its radio's name, unlike its neighbours.
          {"GSM",
           {"NAS GMM", "NAS MM", "Serving Cell Info", "Idle Config", "Idle Serv Cell Meas",
            "Connected Serv Cell Meas", "GSM GPRS Config", "LTE Neighbor Cell Meas",
            "UMTS Neighbor Cell Meas", "GSM Neighbor Cell Meas", "Active Bearers"}},
      } {}

const NorvoViewItems& NorvoViewItems::shared() {
  static const NorvoViewItems items;
  return items;
}

#include "tarn/sim/NasReports.h"

#include "messages/Metrics.h"

namespace tarn::sim::nas_reports {
namespace {

using namespace messages;

constexpr std::uint32_t kT3412S = 3240;
constexpr std::uint32_t kT3212S = 3600;
constexpr std::uint32_t kT3312S = 3240;

bool registered(RegStatus status) {
  return status == KCellularEmmContext::KREG_STATUS_NORMAL_SERVICE;
}

}  // namespace

service::Metric emmContext(const ReportContext& context) {
  const NasState& nas = context.phone.nas();
  const platform::Bytes plmn = identity::encodePlmn(context.network.plmn);
  KCellularEmmContext record;
  record.setTimestamp(context.atMs);
  record.setRegStatus(nas.emmStatus);
  record.setUpdateStatus(nas.emmUpdate);
  record.setUeOpMode(KCellularEmmContext::EPS_UE_OP_MODE_CSPS_MODE_1);
  for (const std::uint32_t tac : nas.trackingAreas) {
    auto area = std::make_shared<KCellularTrackingAreaId>();
    area->setEncodedPlmn(plmn);
    area->setTac(tac);
    record.addTaiList(area);
  }
  if (nas.guti.mTmsi != 0) {
    auto guti = std::make_shared<messages::Guti>();
    guti->setMmegi(nas.guti.mmegi);
    guti->setMmec(nas.guti.mmec);
    guti->setMTmsi(nas.guti.mTmsi);
    record.setGuti(guti);
  }
  record.setRejectCause(KCellularEmmContext::EMM_CAUSE_NO_CAUSE);
  record.setRegProc(nas.emmProcedure);
  record.setT3412DurS(kT3412S);
  record.setIsImsVoiceSupported(true);
  record.setIsEmergBearerSupported(true);
  return metricOf(messages::metric::KCellularEmmContext, record);
}

service::Metric mmContext(const ReportContext& context) {
  const NasState& nas = context.phone.nas();
  KCellularMmContext record;
  record.setTimestamp(context.atMs);
  record.setRegStatus(nas.mmStatus);
  record.setUpdateStatus(registered(nas.mmStatus) ? KCellularMmContext::STATUS_UPDATED
                                                  : KCellularMmContext::STATUS_NOT_UPDATED);
  if (nas.lac != 0) {
    auto lai = std::make_shared<KCellularLocationAreaId>();
    lai->setEncodedPlmn(identity::encodePlmn(context.network.plmn));
    lai->setLac(nas.lac);
    record.setLai(lai);
    record.setTmsi(nas.tmsi);
  }
  record.setT3212DurS(kT3212S);
  record.setProcFailureCause(KCellularMmContext::KNAS_MM_PROC_FAILURE_CAUSE_NONE);
  record.setRejectCause(KCellularMmContext::KNAS_MM_REJ_CAUSE_NONE);
  record.setIsCombinedProc(nas.combined);
  return metricOf(messages::metric::KCellularMmContext, record);
}

service::Metric gmmContext(const ReportContext& context) {
  const NasState& nas = context.phone.nas();
  KCellularGmmContext record;
  record.setTimestamp(context.atMs);
  record.setRegStatus(nas.gmmStatus);
  record.setUpdateStatus(registered(nas.gmmStatus) ? KCellularGmmContext::GPRS_STATUS_UPDATED
                                                   : KCellularGmmContext::GPRS_STATUS_NOT_UPDATED);
  if (nas.rac != 0) {
    auto rai = std::make_shared<RoutingAreaId>();
    rai->setEncodedPlmn(identity::encodePlmn(context.network.plmn));
    rai->setLac(nas.routingLac);
    rai->setRac(nas.rac);
    record.setRai(rai);
    record.setPTmsi(nas.pTmsi);
  }
  record.setT3312DurS(kT3312S);
  record.setProcFailureCause(KCellularMmContext::KNAS_MM_PROC_FAILURE_CAUSE_NONE);
  record.setRejectCause(KCellularMmContext::KNAS_MM_REJ_CAUSE_NONE);
  record.setRegProc(nas.gmmProcedure);
  return metricOf(messages::metric::KCellularGmmContext, record);
}

service::Metric mmCommonInfo(const ReportContext& context) {
  KCellularMmCommonInfo record;
  record.setTimestamp(context.atMs);
  record.setImsi(identity::encodeImsi(context.subscriber.imsi));
  auto home = std::make_shared<messages::Plmn>();
  home->setEncodedPlmn(identity::encodePlmn(context.network.plmn));
  record.addEplmnList(home);
  return metricOf(messages::metric::KCellularMmCommonInfo, record);
}

service::Metric activeBearers(const ReportContext& context) {
  const std::vector<Bearer>& bearers = context.phone.nas().bearers;
  KCellularActivatedBearerContexts record;
  record.setTimestamp(context.atMs);
  record.setBearerContextCount(static_cast<std::uint32_t>(bearers.size()));
  for (const Bearer& bearer : bearers) {
    auto entry = std::make_shared<BearerContext>();
    entry->setCid(bearer.cid);
    entry->setNsapi(bearer.nsapi);
    entry->setApn(bearer.apn);
    entry->setPdpType(bearer.type);
    entry->setPdpAddr(bearer.address);
    entry->setPrimaryDnsType(bearer.dnsType);
    entry->setPrimaryDnsAddr(bearer.primaryDns);
    entry->setSecondaryDnsType(bearer.dnsType);
    entry->setSecondaryDnsAddr(bearer.secondaryDns);
    entry->setIsAddrIratMobile(bearer.iratMobile);
    record.addBearerContexts(entry);
  }
  return metricOf(messages::metric::KCellularActivatedBearerContexts, record);
}

}  // namespace tarn::sim::nas_reports

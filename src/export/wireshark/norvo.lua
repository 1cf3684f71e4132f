-- Wireshark dissector for Norvo metric packets, as `norvo export --to pcapng` and
-- `norvo record --to pcapng` write them (docs/wireshark.md). Each packet comes through
-- Wireshark's upper-PDU export, which names this dissector; it reads Norvo's header and hands
-- the payload to Wireshark's protobuf dissector as the record its metric ID names.
--
-- The table `metrics` above this part is generated from the metric IDs declared in proto/.

local norvo = Proto("norvo", "Norvo metric")

local fields = {
  version = ProtoField.uint8("norvo.version", "Header version"),
  device_length = ProtoField.uint16("norvo.device_length", "Device name length"),
  metric_id = ProtoField.uint32("norvo.metric_id", "Metric ID", base.HEX),
  device = ProtoField.string("norvo.device", "Device"),
  metric = ProtoField.string("norvo.metric", "Metric name"),
  record = ProtoField.string("norvo.record", "Record"),
  payload = ProtoField.bytes("norvo.payload", "Payload"),
}
norvo.fields = fields

local unknown_version = ProtoExpert.new("norvo.unknown_version", "Header version not understood",
                                        expert.group.UNDECODED, expert.severity.WARN)
local cut_short = ProtoExpert.new("norvo.cut_short", "Header cut short",
                                  expert.group.MALFORMED, expert.severity.ERROR)
norvo.experts = { unknown_version, cut_short }

local HEADER_LENGTH = 8
local protobuf = Dissector.get("protobuf")

function norvo.dissector(tvb, pinfo, tree)
  pinfo.cols.protocol = "Norvo"
  local header = tree:add(norvo, tvb())
  if tvb:len() < HEADER_LENGTH then
    header:add_proto_expert_info(cut_short)
    return tvb:len()
  end
  header:add(fields.version, tvb(0, 1))
  if tvb(0, 1):uint() ~= 1 then
    header:add_proto_expert_info(unknown_version)
    return tvb:len()
  end
  local device_length = tvb(2, 2):uint()
  local metric_id = tvb(4, 4):uint()
  header:add(fields.device_length, tvb(2, 2))
  header:add(fields.metric_id, tvb(4, 4))
  local payload_at = HEADER_LENGTH + device_length
  if tvb:len() < payload_at then
    header:add_proto_expert_info(cut_short)
    return tvb:len()
  end
  if device_length > 0 then header:add(fields.device, tvb(HEADER_LENGTH, device_length)) end

  local metric = metrics[metric_id]
  local name = metric and (metric.record or metric.name) or "unknown metric"
  if metric then
    header:add(fields.metric, metric.name)
    if metric.record then header:add(fields.record, metric.record) end
  end
  pinfo.cols.info = string.format("0x%06X %s", metric_id, name)
  header:set_len(payload_at)

  local payload_length = tvb:len() - payload_at
  if payload_length == 0 then return tvb:len() end
  local payload = tvb(payload_at, payload_length)
  if metric and metric.message then
    pinfo.private["pb_msg_type"] = "message," .. metric.message
    protobuf:call(payload:tvb(), pinfo, tree)
  else
    header:add(fields.payload, payload)
  end
  return tvb:len()
end

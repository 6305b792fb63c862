-- Wireshark: dissects the messages of the invitation protocol, with Wireshark's own Protocol Buffers
-- dissector and the schema proto/orv.proto. A UDP datagram holds one envelope, a TCP stream envelopes behind
-- their lengths as varints. docs/wireshark.md says how to set it up. The build puts the table KINDS before it.

local ENVELOPE = "orv.SessionMessage"

local TYPE_FIELD, DATA_FIELD = 2, 3
local VARINT, FIXED64, LENGTH_DELIMITED, FIXED32 = 0, 1, 2, 5
local LONGEST_LENGTH = 5
local TCP = 2 -- as in pinfo.port_type

local kind_names = {}
for number, kind in pairs(KINDS) do
  kind_names[number] = kind.name
end

local orv = Proto("orv", "Invitation protocol")
orv.fields.length = ProtoField.uint32("orv.length", "Length of the envelope")
orv.fields.type = ProtoField.uint32("orv.type", "Type of the envelope", base.DEC, kind_names)
orv.fields.payload = ProtoField.string("orv.payload", "Payload message")
orv.experts.malformed =
  ProtoExpert.new("orv.malformed", "Not an envelope", expert.group.MALFORMED, expert.severity.ERROR)
orv.prefs.udp = Pref.range("UDP ports", "", "Ports whose datagrams hold one envelope each", 65535)
orv.prefs.tcp = Pref.range("TCP ports", "", "Ports whose streams hold envelopes behind their lengths", 65535)

local protobuf = Dissector.get("protobuf")

-- The varint at the offset and the offset behind it; nothing if the bytes end in it, or if it is longer than
-- `longest`.
local function read_varint(tvb, offset, longest)
  local value, factor = 0, 1
  for at = offset, math.min(offset + longest, tvb:len()) - 1 do
    local byte = tvb(at, 1):uint()
    value = value + (byte % 128) * factor
    if byte < 128 then
      return value, at + 1
    end
    factor = factor * 128
  end
end

-- The kind of an envelope: the last of its type fields. Nothing if it has none, or if it is malformed.
local function kind_of(tvb)
  local number
  local offset = 0
  while offset < tvb:len() do
    local tag, value
    tag, offset = read_varint(tvb, offset, 5)
    if not tag then
      return number
    end
    local wire_type = tag % 8
    if wire_type == VARINT then
      value, offset = read_varint(tvb, offset, 10)
      if math.floor(tag / 8) == TYPE_FIELD then
        number = value
      end
    elseif wire_type == LENGTH_DELIMITED then
      value, offset = read_varint(tvb, offset, LONGEST_LENGTH)
      offset = offset and offset + value
    elseif wire_type == FIXED32 then
      offset = offset + 4
    elseif wire_type == FIXED64 then
      offset = offset + 8
    else
      return number
    end
    if not offset then
      return number
    end
  end
  return number
end

-- The data of an envelope, in its place in the tree: called by the Protocol Buffers dissector.
local payload = Proto("orv_payload", "Invitation payload")
function payload.dissector(tvb, pinfo, tree)
  local name = pinfo.private["orv_payload"]
  if not name or name == "" then
    return 0
  end
  pinfo.private["pb_msg_type"] = "message," .. name
  return protobuf:call(tvb, pinfo, tree)
end
DissectorTable.get("protobuf_field"):add(ENVELOPE .. ".data", payload)

local function dissect_envelope(tvb, pinfo, tree)
  local branch = tree:add(orv, tvb())
  local number = kind_of(tvb)
  local kind = KINDS[number] or {}
  local name = kind.name or (number and "type " .. tostring(number)) or "no type"
  branch:append_text(": " .. name)
  if number and number <= 0xFFFFFFFF then
    branch:add(orv.fields.type, number):set_generated()
  end
  if kind.payload then
    branch:append_text(", " .. kind.payload)
    branch:add(orv.fields.payload, kind.payload):set_generated()
  end
  pinfo.private["orv_payload"] = kind.payload or ""
  pinfo.private["pb_msg_type"] = "message," .. ENVELOPE
  -- It raises an error where the bytes end too early.
  if not pcall(Dissector.call, protobuf, tvb, pinfo, branch) then
    branch:add_proto_expert_info(orv.experts.malformed)
    name = name .. " (malformed)"
  end
  return name
end

-- The names of the envelopes in a TCP segment, as far as they are whole; the rest is asked for.
local function dissect_stream(tvb, pinfo, tree)
  local names = {}
  local offset = 0
  while offset < tvb:len() do
    local length, start = read_varint(tvb, offset, LONGEST_LENGTH)
    if not length or start + length > tvb:len() then
      if not length and tvb:len() - offset >= LONGEST_LENGTH then
        tree:add_proto_expert_info(orv.experts.malformed, "Length of more than five bytes")
        break
      end
      pinfo.desegment_offset = offset
      pinfo.desegment_len = length and start + length - tvb:len() or DESEGMENT_ONE_MORE_SEGMENT
      break
    end
    tree:add(orv.fields.length, tvb(offset, start - offset), length)
    if length > 0 then
      names[#names + 1] = dissect_envelope(tvb(start, length):tvb(), pinfo, tree)
    end
    offset = start + length
  end
  return names
end

function orv.dissector(tvb, pinfo, tree)
  local names
  if pinfo.port_type == TCP then
    names = dissect_stream(tvb, pinfo, tree)
  else
    names = { dissect_envelope(tvb, pinfo, tree) }
  end
  if #names > 0 then
    pinfo.cols.protocol = "ORV"
    -- Behind a segment that completes an envelope the rest of it is dissected on its own, and what the column
    -- holds by then stays.
    local separator = pinfo.private["orv_seen"] and ", " or ""
    pinfo.cols.info = separator .. table.concat(names, ", ")
    pinfo.private["orv_seen"] = "yes"
  end
  return tvb:len()
end

local tables = { udp = DissectorTable.get("udp.port"), tcp = DissectorTable.get("tcp.port") }
for _, ports in pairs(tables) do
  ports:add_for_decode_as(orv)
end

local registered = { udp = "", tcp = "" }
function orv.prefs_changed()
  for protocol, ports in pairs(tables) do
    if registered[protocol] ~= "" then
      ports:remove(registered[protocol], orv)
    end
    registered[protocol] = orv.prefs[protocol]
    if registered[protocol] ~= "" then
      ports:add(registered[protocol], orv)
    end
  end
end

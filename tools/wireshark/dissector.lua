-- Wireshark: dissects the messages of the invitation protocol, with Wireshark's own Protocol Buffers
-- dissector and the schema proto/orv.proto. A UDP datagram holds one envelope, a TCP stream envelopes behind
-- their lengths as varints. docs/wireshark.md says how to set it up. The build puts the tables KINDS and MESSAGES
-- before it.

local ENVELOPE = "orv.SessionMessage"

local TYPE_FIELD, DATA_FIELD = 2, 3
local VARINT, FIXED64, LENGTH_DELIMITED, START_GROUP, END_GROUP, FIXED32 = 0, 1, 2, 3, 4, 5
local LONGEST_LENGTH = 5
local MOST_NESTING = 100
local TCP = 2 -- as in pinfo.port_type

local kind_names = {}
for number, kind in pairs(KINDS) do
  kind_names[number] = kind.name
end

local orv = Proto("orv", "Invitation protocol")
orv.fields.length = ProtoField.uint32("orv.length", "Length of the envelope")
orv.fields.type = ProtoField.int32("orv.type", "Type of the envelope", base.DEC, kind_names)
orv.fields.payload = ProtoField.string("orv.payload", "Payload message")
orv.fields.hex = ProtoField.string("orv.hex", "Behind its length, in hexadecimal digits")
orv.experts.malformed =
  ProtoExpert.new("orv.malformed", "Malformed", expert.group.MALFORMED, expert.severity.ERROR)
orv.prefs.udp = Pref.range("UDP ports", "", "Ports whose datagrams hold one envelope each", 65535)
orv.prefs.tcp = Pref.range("TCP ports", "", "Ports whose streams hold envelopes behind their lengths", 65535)

local protobuf = Dissector.get("protobuf")

-- The varint at the offset and the offset behind it; nothing if it does not end before the limit, or is longer than
-- `longest`. Of a long one the first five bytes are read, which hold more than 32 bits.
local function read_varint(tvb, offset, limit, longest)
  local value, factor = 0, 1
  for at = offset, math.min(offset + longest, limit) - 1 do
    local byte = tvb(at, 1):uint()
    if at < offset + 5 then
      value = value + (byte % 128) * factor
      factor = factor * 128
    end
    if byte < 128 then
      return value, at + 1
    end
  end
end

local function varint(value)
  local digits = ""
  while value >= 128 do
    digits = digits .. string.format("%02x", value % 128 + 128)
    value = math.floor(value / 128)
  end
  return digits .. string.format("%02x", value)
end

local function fail(offset, reason)
  error({ offset = offset, reason = reason }, 0)
end

-- Fails unless a message, or the group of this number, is well-formed from the offset to the limit; the offset behind
-- it. `fields` says which fields are messages or texts. `see` is called with each number and value, and where the value
-- ends.
local function walk(tvb, offset, limit, fields, nesting, group, see)
  while offset < limit do
    local start = offset
    local tag, value
    tag, offset = read_varint(tvb, offset, limit, 5)
    if not tag or tag < 8 or tag >= 2 ^ 32 then
      fail(start, "malformed tag")
    end
    local number, wire_type = math.floor(tag / 8), tag % 8
    if wire_type == VARINT then
      value, offset = read_varint(tvb, offset, limit, 10)
    elseif wire_type == LENGTH_DELIMITED then
      value, offset = read_varint(tvb, offset, limit, LONGEST_LENGTH)
      offset = offset and offset + value
    elseif wire_type == FIXED32 then
      offset = offset + 4
    elseif wire_type == FIXED64 then
      offset = offset + 8
    elseif wire_type == START_GROUP and nesting < MOST_NESTING then
      offset = walk(tvb, offset, limit, {}, nesting + 1, number)
    elseif wire_type == END_GROUP and number == group then
      return offset
    else
      fail(start, "wire type " .. wire_type .. " where none can be")
    end
    if not offset or offset > limit then
      fail(start, "field " .. number .. " runs past the end")
    end
    local kind = wire_type == LENGTH_DELIMITED and fields[number]
    if kind == "string" and value > 0 then
      local text = tvb(offset - value, value)
      if text:string(ENC_UTF_8) ~= text:raw() then
        fail(start, "ill-formed UTF-8 in field " .. number)
      end
    elseif kind and kind ~= "string" then
      walk(tvb, offset - value, offset, MESSAGES[kind], nesting + 1)
    end
    if see then
      see(number, wire_type, value, offset)
    end
  end
  if group then
    fail(limit - 1, "group without its end")
  end
  return offset
end

-- The type of an envelope, which is the last of its type fields, if it has one; and what is wrong with the envelope or
-- with its payload, the last of its data fields, if anything is.
local function look_into(tvb)
  local number, data_start, data_end
  local fine, fault = pcall(walk, tvb, 0, tvb:len(), MESSAGES[ENVELOPE], 0, nil, function(field, wire_type, value, stop)
    if field == TYPE_FIELD and wire_type == VARINT then
      number = value % 2 ^ 32
      number = number < 2 ^ 31 and number or number - 2 ^ 32
    elseif field == DATA_FIELD and wire_type == LENGTH_DELIMITED then
      data_start, data_end = stop - value, stop
    end
  end)
  local payload = (KINDS[number] or {}).payload
  if fine and payload and data_start then
    fine, fault = pcall(walk, tvb, data_start, data_end, MESSAGES[payload], 0)
  end
  if not fine then
    return number, fault
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
  -- It raises an error where the bytes end too early, which look_into has found.
  pcall(Dissector.call, protobuf, tvb, pinfo, tree)
  return tvb:len()
end
DissectorTable.get("protobuf_field"):add(ENVELOPE .. ".data", payload)

local function dissect_envelope(tvb, pinfo, tree)
  local branch = tree:add(orv, tvb())
  -- For the command orv, which reads envelopes behind their lengths.
  branch:add(orv.fields.hex, varint(tvb:len()) .. tvb:bytes():tohex(true)):set_hidden()
  local number, fault = look_into(tvb)
  local kind = KINDS[number] or {}
  local name = kind.name or (number and string.format("type %d", number)) or "no type"
  branch:append_text(": " .. name)
  if number then
    branch:add(orv.fields.type, number):set_generated()
  end
  if kind.payload then
    branch:append_text(", " .. kind.payload)
    branch:add(orv.fields.payload, kind.payload):set_generated()
  end
  pinfo.private["orv_payload"] = kind.payload or ""
  pinfo.private["pb_msg_type"] = "message," .. ENVELOPE
  pcall(Dissector.call, protobuf, tvb, pinfo, branch)
  if fault then
    local reason = string.format("Malformed: byte %d of the envelope: %s", fault.offset, fault.reason)
    branch:add_tvb_expert_info(orv.experts.malformed, tvb(fault.offset), reason)
    name = name .. " (malformed)"
  end
  return name
end

-- The names of the envelopes in a TCP segment, as far as they are whole; the rest is asked for.
local function dissect_stream(tvb, pinfo, tree)
  local names = {}
  local offset = 0
  while offset < tvb:len() do
    local length, start = read_varint(tvb, offset, tvb:len(), LONGEST_LENGTH)
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

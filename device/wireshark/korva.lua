-- Wireshark dissector of the control stream: frames of a 4-byte little-endian length and UTF-8 XML,
-- on TCP port 803.
--
-- Each message is shown with its elements, a reply leads to its request and back, and a request that
-- a host will drop without a word is marked with the reason.
--
-- Copy this file into the folder of personal Lua plug-ins that Wireshark names under "About", or give
-- it to tshark by -X lua_script:korva.lua, as any user but root.

local korva = Proto("korva", "Korva Control Stream")

local kinds = { -- which side sends the element, as its root
    ExecuteCommand = "request",
    CommandReply = "reply",
    Event = "event",
}

local f = korva.fields
f.length = ProtoField.uint32("korva.length", "Length", base.DEC)
f.text = ProtoField.string("korva.text", "Text", base.UNICODE)
f.message = ProtoField.string("korva.message", "Message")
f.kind = ProtoField.string("korva.kind", "Kind", base.ASCII, "request, reply or event")
f.name = ProtoField.string("korva.name", "Name", base.UNICODE)
f.correlation = ProtoField.string("korva.correlation", "Correlation", base.UNICODE)
f.result = ProtoField.string("korva.result", "Result", base.UNICODE)
f.description = ProtoField.string("korva.description", "Description", base.UNICODE)
f.parameter = ProtoField.string("korva.parameter", "Parameter", base.UNICODE, "NAME=VALUE")
f.parameter_name = ProtoField.string("korva.parameter.name", "Name", base.UNICODE)
f.parameter_value = ProtoField.string("korva.parameter.value", "Value", base.UNICODE)
f.listed = ProtoField.string("korva.listed", "Listed", base.UNICODE, "A command or event of a list")
f.version = ProtoField.string("korva.version", "Stream version")
f.request_in = ProtoField.framenum("korva.request_in", "Request in", base.NONE, frametype.REQUEST)
f.reply_in = ProtoField.framenum("korva.reply_in", "Reply in", base.NONE, frametype.RESPONSE)
f.time = ProtoField.relative_time("korva.time", "Time since the request")

local silent = ProtoExpert.new("korva.silent", "The host answers nothing to this message",
    expert.group.PROTOCOL, expert.severity.WARN)
local failure = ProtoExpert.new("korva.failure", "The command failed",
    expert.group.RESPONSE_CODE, expert.severity.NOTE)
local unreadable = ProtoExpert.new("korva.unreadable", "The text cannot be read as a message",
    expert.group.MALFORMED, expert.severity.ERROR)
korva.experts = { silent, failure, unreadable }

korva.prefs.port = Pref.uint("TCP port", 803, "The port on which the host listens")

local header_size = 4
local stream_of = Field.new("tcp.stream")

-- What is shown beside other things is cut; the text itself is always there whole.
local shown_size = 200

-- Requests and replies find each other by stream and correlation. A correlation may come again, and
-- a reply belongs to the last request that bore it.
local requests, replies
local messages_in_packet = 0

function korva.init()
    requests, replies = {}, {}
end

local entities = { lt = "<", gt = ">", apos = "'", quot = '"', amp = "&" }

local function decode(text)
    return (text:gsub("&(%a+);", entities))
end

-- The length of the character at a position, 0 where its bytes are not UTF-8.
local function character_at(text, position)
    local first, second = text:byte(position, position + 1)
    second = second or 0
    if first < 0x80 then
        return 1
    end
    local size, low, high = 0, 0x80, 0xBF
    if first >= 0xC2 and first <= 0xDF then
        size = 2
    elseif first >= 0xE0 and first <= 0xEF then
        size = 3
        low = first == 0xE0 and 0xA0 or 0x80 -- below: an overlong form
        high = first == 0xED and 0x9F or 0xBF -- above: half of a surrogate pair
    elseif first >= 0xF0 and first <= 0xF4 then
        size = 4
        low = first == 0xF0 and 0x90 or 0x80
        high = first == 0xF4 and 0x8F or 0xBF
    end
    local tail = string.rep("[\x80-\xBF]", math.max(size - 2, 0))
    local good = size > 0 and second >= low and second <= high
        and text:find("^" .. tail, position + 2)
    return good and size or 0
end

-- Puts U+FFFD in the place of each byte that is not UTF-8, and of each zero.
local function readable(bytes)
    bytes = bytes:gsub("\0", "\xEF\xBF\xBD")
    if not bytes:find("[\x80-\xFF]") then
        return bytes
    end
    local parts, position = {}, 1
    while position <= #bytes do
        local size = character_at(bytes, position)
        parts[#parts + 1] = size > 0 and bytes:sub(position, position + size - 1) or "\xEF\xBF\xBD"
        position = position + math.max(size, 1)
    end
    return table.concat(parts)
end

local function cut(text)
    if #text <= shown_size then
        return text
    end
    local last = shown_size
    while last > 0 and text:byte(last + 1) >= 0x80 and text:byte(last + 1) < 0xC0 do
        last = last - 1 -- not in the middle of a character
    end
    return text:sub(1, last) .. "…"
end

-- A piece of the text: its bytes, and where they lie. Positions count from 1, as in the string.
local function piece(message, first, last)
    if last < first then
        return { text = "", first = first, last = last, value = "" }
    end
    local range = message.range(first - 1, last - first + 1)
    return { text = message.text:sub(first, last), first = first, last = last,
        value = decode(readable(range:raw())), range = range }
end

-- Finds <name>content</name> or <name/> between two positions. What a host writes is never nested in
-- an element of the same name, so that the next end tag is its own.
local function element(message, name, first, last)
    local text = message.text
    local opened = "<" .. name
    local begin = text:find(opened, first, true)
    while begin and begin <= last do
        local after = text:sub(begin + #opened, begin + #opened)
        if after == ">" or after == "/" or after:match("^%s$") then
            local tag_end = text:find(">", begin, true)
            if not tag_end then
                return nil
            end
            if text:sub(tag_end - 1, tag_end - 1) == "/" then
                return piece(message, tag_end, tag_end - 1), tag_end + 1
            end
            local close = text:find("</" .. name .. ">", tag_end + 1, true)
            if not close then
                return nil
            end
            return piece(message, tag_end + 1, close - 1), close + #name + 3
        end
        begin = text:find(opened, begin + 1, true)
    end
    return nil
end

local function add(tree, field, found)
    if not found then
        return nil
    end
    if found.range then
        return tree:add(field, found.range, found.value)
    end
    return tree:add(field, found.value)
end

local function each(message, name, first, last, visit)
    local position = first
    while position <= last do
        local found, after = element(message, name, position, last)
        if not found then
            return
        end
        visit(found)
        position = after
    end
end

local function add_parameters(message, tree, list, description)
    local words = {}
    each(message, "Parameter", list.first, list.last, function(parameter)
        local name = element(message, "Name", parameter.first, parameter.last)
        local value = element(message, description, parameter.first, parameter.last)
        local shown = (name and name.value or "") .. "=" .. (value and value.value or "")
        local branch = tree:add(f.parameter, parameter.range or message.range(), shown)
        add(branch, f.parameter_name, name)
        add(branch, f.parameter_value, value)
        words[#words + 1] = shown
    end)
    return words
end

local function is_request(message)
    return message.to_host
end

-- Why a host drops a request, or nil. This tells the faults that a device may well make, and not
-- everything that is no XML.
local function silence_of(message)
    local root = message.root
    local function empty(name)
        local found = element(message, name, message.first, message.last)
        return not found or not found.text:find("%S")
    end
    if root == "ExecuteCommand" or root == "CommandInformation" then
        if empty("Name") then return "it has no Name" end
        if empty("Correlation") then return "it has no Correlation" end
        local list = element(message, "Parameters", message.first, message.last)
        local nameless = false
        if root == "ExecuteCommand" and list then
            each(message, "Parameter", list.first, list.last, function(parameter)
                local name = element(message, "Name", parameter.first, parameter.last)
                nameless = nameless or not name or not name.text:find("%S")
            end)
        end
        return nameless and "a parameter has no Name" or nil
    elseif root == "Commands" then
        return empty("Correlation") and "it has no Correlation" or nil
    elseif root == "EventInformation" then
        local text = message.text:sub(message.first, message.last):match("^([^<]*)")
        return not text:find("%S") and "it has no name as its own text" or nil
    elseif root == "ServerInformation" or root == "Events" then
        return nil
    end
    return "it is none of the six requests"
end

-- Finds the element that tells what the message is. The list of commands has its correlation before
-- it, as an element of its own.
local function find_root(message)
    local text = message.text
    local position = text:match("^%s*<%?.-%?>()") or 1
    message.top = position
    if text:find("^%s*<Correlation[ >/]", position) then
        local _, after = element(message, "Correlation", position, #text)
        position = after or position
    end
    local root, tag_end = text:match("^%s*<(%a[%w.]*)[^>]*()>", position)
    if not root then
        return false
    end
    message.root = root
    if text:sub(tag_end - 1, tag_end - 1) == "/" then
        message.first, message.last = tag_end + 1, tag_end
        return true
    end
    local close = text:find("</" .. root .. ">", tag_end + 1, true)
    if not close then
        return false
    end
    message.first, message.last = tag_end + 1, close - 1
    return true
end

local function kind_of(message)
    if kinds[message.root] then
        return kinds[message.root]
    end
    return is_request(message) and "request" or "reply"
end

local function key_of(correlation)
    return tostring(stream_of().value) .. " " .. correlation
end

-- Notes a request or a reply at the first sight of the packet, and leads from one to the other.
local function link(message, tree, pinfo, correlation)
    local key = key_of(correlation)
    local here = pinfo.number .. " " .. key
    if is_request(message) then
        if not pinfo.visited then
            requests[key] = { number = pinfo.number, time = pinfo.rel_ts }
        elseif replies[here] then
            tree:add(f.reply_in, replies[here]):set_generated()
        end
        return
    end
    if not pinfo.visited and requests[key] then
        replies[here] = requests[key]
        replies[requests[key].number .. " " .. key] = pinfo.number
        requests[key] = nil
    end
    local request = replies[here]
    if type(request) == "table" then
        tree:add(f.request_in, request.number):set_generated()
        local seconds = pinfo.rel_ts - request.time
        local whole = math.floor(seconds)
        local time = NSTime.new(whole, math.floor((seconds - whole) * 1e9 + 0.5))
        tree:add(f.time, time):set_generated()
    end
end

local function add_lists(message, tree, words)
    local lists = {
        { "Parameters", message.root == "EventInformation" and "Description" or "Value" },
        { "InputParameters", "Value" }, -- the description of a command's parameter is called so
        { "ReplyParameters", "Value" },
    }
    for _, list in ipairs(lists) do
        local found = element(message, list[1], message.first, message.last)
        if found then
            local branch = tree
            if list[1] ~= "Parameters" then
                branch = tree:add(korva, found.range or message.range(), list[1])
            end
            for _, word in ipairs(add_parameters(message, branch, found, list[2])) do
                words[#words + 1] = cut(word)
            end
        end
    end
end

local function add_listed(message, tree)
    local singular = ({ Commands = "Command", Events = "Event" })[message.root]
    local count = 0
    if singular then
        each(message, singular, message.first, message.last, function(found)
            add(tree, f.listed, found)
            count = count + 1
        end)
    end
    return count
end

local function add_content(message, tree, pinfo)
    local words = { message.root }
    local name
    if message.root == "EventInformation" and is_request(message) then
        local last = (message.text:find("<", message.first, true) or message.first) - 1
        name = piece(message, message.first, math.min(last, message.last))
    else
        name = element(message, "Name", message.first, message.last)
    end
    add(tree, f.name, name)
    words[#words + 1] = name and name.value or nil
    local correlation = element(message, "Correlation", message.top, #message.text)
    if add(tree, f.correlation, correlation) then
        words[#words + 1] = "#" .. cut(correlation.value)
        link(message, tree, pinfo, correlation.text)
    end
    local result = element(message, "Result", message.first, message.last)
    local shown = add(tree, f.result, result)
    if shown then
        words[#words + 1] = cut(result.value)
        if result.value ~= "OK" then
            shown:add_proto_expert_info(failure, "The command failed: " .. cut(result.value))
        end
    end
    add(tree, f.description, element(message, "Description", message.first, message.last))
    local major, minor = message.text:match('<StreamVersion major="(%d+)" minor="(%d+)"')
    if major then
        tree:add(f.version, major .. "." .. minor)
        words[#words + 1] = major .. "." .. minor
    end
    local count = add_listed(message, tree)
    if count > 0 then
        words[#words + 1] = count .. " listed"
    end
    add_lists(message, tree, words)
    return table.concat(words, " ")
end

local function dissect_message(tvb, pinfo, tree)
    local length = tvb(0, header_size):le_uint()
    local branch = tree:add(korva, tvb())
    branch:add_le(f.length, tvb(0, header_size))
    local message = { to_host = pinfo.dst_port == korva.prefs.port, text = "" }
    if length > 0 then
        message.range = tvb(header_size, length)
        message.text = message.range:raw()
        branch:add(f.text, message.range, readable(message.text))
    end
    local summary
    if length > 0 and find_root(message) then
        branch:add(f.message, message.root)
        branch:add(f.kind, kind_of(message))
        summary = add_content(message, branch, pinfo)
        local reason = is_request(message) and silence_of(message)
        if reason then
            branch:add_proto_expert_info(silent, "The host answers nothing: " .. reason)
        end
    else
        summary = length == 0 and "(empty)" or "(unreadable)"
        branch:add_proto_expert_info(unreadable)
    end
    branch:append_text(": " .. cut(summary))
    if messages_in_packet > 0 then
        pinfo.cols.info:append(" | " .. cut(summary))
    else
        pinfo.cols.info = cut(summary)
    end
    messages_in_packet = messages_in_packet + 1
    return tvb:len()
end

-- A header may claim more than Wireshark can count; such a frame never becomes whole.
local largest = 0x7FFFFFFF

local function frame_size(tvb, _, offset)
    return math.min(header_size + tvb(offset, header_size):le_uint(), largest)
end

function korva.dissector(tvb, pinfo, tree)
    pinfo.cols.protocol = "KORVA"
    pinfo.cols.info = "(part of a frame)"
    messages_in_packet = 0
    dissect_tcp_pdus(tvb, tree, header_size, frame_size, dissect_message)
    return tvb:len()
end

local ports = DissectorTable.get("tcp.port")
local registered

local function listen_on_port()
    if registered then
        ports:remove(registered, korva)
    end
    registered = korva.prefs.port
    ports:add(registered, korva)
end

korva.prefs_changed = listen_on_port -- the user may choose another
listen_on_port()

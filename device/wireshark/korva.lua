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
local not_captured = ProtoExpert.new("korva.not_captured", "The capture lacks a part of this message",
    expert.group.UNDECODED, expert.severity.NOTE)
korva.experts = { silent, failure, unreadable, not_captured }

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

-- Where a piece of markup that is no element ends: a declaration, a comment and their like.
local function special_end(text, begin)
    for start, stop in pairs({ ["<!--"] = "-->", ["<?"] = "?>", ["<![CDATA["] = "]]>" }) do
        if text:sub(begin, begin + #start - 1) == start then
            local _, last = text:find(stop, begin + #start, true)
            return last
        end
    end
    return text:sub(begin, begin + 1) == "<!" and text:find(">", begin, true) or nil
end

-- Visits the elements that lie between two positions, but not what lies in them: visit(name, first,
-- last) gets the positions of the content, and ends it all by returning true. What a host writes is
-- never nested in an element of the same name, so that the next end tag is its own. Returns where
-- the reading ended.
local function each_child(message, first, last, visit)
    local text, position = message.text, first
    while position <= last do
        local begin = text:find("<", position, true)
        if not begin or begin > last then
            return position
        end
        local name, tag_end = text:match("^<([^%s/>?!<]+)[^<>]*()>", begin)
        local special = not name and special_end(text, begin)
        if special then
            position = special + 1
        elseif not name or tag_end > last then
            return position
        elseif text:sub(tag_end - 1, tag_end - 1) == "/" then
            position = tag_end + 1
            if visit(name, position, tag_end) then
                return position
            end
        else
            local close, close_end = text:find("</" .. name .. ">", tag_end + 1, true)
            if not close or close_end > last then
                return position
            end
            position = close_end + 1
            if visit(name, tag_end + 1, close - 1) then
                return position
            end
        end
    end
    return position
end

-- The first element of a name that lies directly between two positions, or nil.
local function element(message, name, first, last)
    local found
    each_child(message, first, last, function(child, from, to)
        if child == name then
            found = piece(message, from, to)
        end
        return found
    end)
    return found
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
    each_child(message, first, last, function(child, from, to)
        if child == name then
            visit(piece(message, from, to))
        end
    end)
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
        local nameless, begun = false, false
        if root == "ExecuteCommand" and list then
            each_child(message, list.first, list.last, function(child, from, to)
                begun = begun or child == "Parameter" -- and so is whatever follows
                local name = begun and element(message, "Name", from, to)
                nameless = begun and (not name or not name.text:find("%S"))
                return nameless
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

-- What a host looks for in a message, in this order.
local request_roots = { "ExecuteCommand", "ServerInformation", "Commands", "CommandInformation",
    "EventInformation", "Events" }

-- Finds the element that tells what the message is. The list of commands has its correlation before
-- it, as an element of its own.
local function find_root(message)
    local roots = {}
    local rest = each_child(message, 1, #message.text, function(name, first, last)
        roots[#roots + 1] = name
        roots[name] = roots[name] or { first = first, last = last }
    end)
    message.correlation = roots.Correlation
    if message.text:find("^%s*[^%s<]") or message.text:find("%S", rest) then
        return false -- there is something outside of the elements
    end
    message.root = roots[1] == "Correlation" and roots[2] or roots[1]
    for index = #request_roots, 1, -1 do
        if is_request(message) and roots[request_roots[index]] then
            message.root = request_roots[index]
        end
    end
    if not message.root then
        return false
    end
    message.first, message.last = roots[message.root].first, roots[message.root].last
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
    local correlation = element(message, "Correlation", message.first, message.last)
    if not correlation and message.correlation and not is_request(message) then
        correlation = piece(message, message.correlation.first, message.correlation.last)
    end
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

local function add_message(message, branch, pinfo)
    branch:add(f.message, message.root)
    branch:add(f.kind, kind_of(message))
    local summary = add_content(message, branch, pinfo)
    local reason = is_request(message) and silence_of(message)
    if reason then
        branch:add_proto_expert_info(silent, "The host answers nothing: " .. reason)
    end
    return summary
end

-- Shows a frame, of which a capture with a limit may hold the first bytes only. Returns a summary.
local function add_frame(tvb, pinfo, branch)
    if tvb:len() < header_size then
        branch:add_proto_expert_info(not_captured)
        return "(not captured)"
    end
    local length = tvb(0, header_size):le_uint()
    local captured = math.min(length, tvb:len() - header_size)
    branch:add_le(f.length, tvb(0, header_size))
    local message = { to_host = pinfo.dst_port == korva.prefs.port, text = "" }
    if captured > 0 then
        message.range = tvb(header_size, captured)
        local bytes = message.range:raw()
        message.text = bytes:match("^[^\0]*") -- a host reads no further than to a zero
        branch:add(f.text, message.range, readable(bytes))
    end
    if captured < length then
        branch:add_proto_expert_info(not_captured)
        return "(not captured)"
    end
    if find_root(message) then
        return add_message(message, branch, pinfo)
    end
    branch:add_proto_expert_info(unreadable)
    return length == 0 and "(empty)" or "(unreadable)"
end

local function dissect_message(tvb, pinfo, tree)
    local branch = tree:add(korva, tvb())
    local summary = cut(add_frame(tvb, pinfo, branch))
    branch:append_text(": " .. summary)
    if messages_in_packet > 0 then
        pinfo.cols.info:append(" | " .. summary)
    else
        pinfo.cols.info = summary
    end
    messages_in_packet = messages_in_packet + 1
    return tvb:len()
end

-- A header may claim more than Wireshark can count; such a frame never becomes whole.
local largest = 0x7FFFFFFF

local function frame_size(tvb, _, offset)
    if tvb:len() < offset + header_size then
        return tvb:reported_length_remaining(offset) -- the capture lacks the header
    end
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

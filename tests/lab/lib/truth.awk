# Compares what the program says with what the kernel, the daemons and the settings say, as guest/readings tells them.
# Prints each difference, with both sides. The exit status is 1 then, and 2 when something changed in the meantime.

/^== / {
  reading = $2
  if (reading == "before" || reading == "after") phase = reading
  next
}

# ---- What is so -----------------------------------------------------------------------------------------------------

reading == "devices" && $1 == "Interface" { device = $2 }
reading == "devices" && $1 == "type" { note("type of " device, $2) }
reading == "devices" && $1 == "ssid" { note("name of " device, behind("ssid")) }
reading == "devices" && $1 == "channel" { note("channel of " device, $2); note("megahertz of " device, substr($3, 2)) }
reading == "flags" { note("up", $1 ~ /[13579bdf]$/) }
reading == "block" { note("block", $2 ? "hardware" : $1 ? "set" : "none") }
reading == "link" && /^(Connected to|Joined IBSS) / { note("joined", toupper($3)) }
reading == "link" && $1 == "SSID:" { note("joined name", behind("SSID:")) }
reading == "link" && $1 == "signal:" { note("signal", $2) }
reading == "link" && /tx bitrate:/ { note("rate", int($3 * 1000 + 0.5)) }
reading == "address" && $3 == "inet" { note("address", $4) }
reading == "way-out" && $2 == "via" && !ways[phase]++ { note("gateway", $3) }
reading == "stations" && $1 == "Station" { note("stations", ++stations[phase]) }
reading ~ /^(supplicant|hostapd)$/ && /^(wpa_state|ssid|bssid|key_mgmt|state|channel|freq|ssid\[0\])=/ {
  note(reading "'s " substr($0, 1, index($0, "=") - 1), substr($0, index($0, "=") + 1))
}

# The name servers that the connection has brought stand between two remarks.
reading == "resolv.conf" && /^# By the DHCP client of wlan0,/ { brought = 1 }
reading == "resolv.conf" && /^# \(end of what/ { brought = 0 }
reading == "resolv.conf" && brought && $1 == "nameserver" { servers = servers (servers == "" ? "" : " ") $2 }

# ---- What is saved --------------------------------------------------------------------------------------------------

reading == "wireless.info" && /^PRODUCT=/ { model = substr($0, 10, length($0) - 10) }
reading == "wireless.conf" && $0 ~ /^[ \t]*ESSID=/ { saved[behind("ESSID")] = 1 }
reading == "wireless_ap.conf" && /^\[/ { section = substr($0, 2, length($0) - 2) }
reading == "wireless_ap.conf" && /=/ && section == model {
  key = $0
  gsub(/^[ \t]*|=.*/, "", key)
  setting[key] = behind(key)
}

# ---- What the program says ------------------------------------------------------------------------------------------

# What is told to people may stand in front of it.
/^\{/ && reading ~ /^(status|access-point|radio|known)$/ {
  document[reading] = $0
  sub(/^\{"result":"ok","[a-z_]*":/, "", document[reading])
}

# ---------------------------------------------------------------------------------------------------------------------

function note(fact, value) {
  if (phase == "before") former[fact] = value
  else now[fact] = value
}

# What stands in this line behind the first word, and what is between them.
function behind(word,    text) {
  text = $0
  sub(/^[ \t]*/, "", text)
  return substr(text, length(word) + 2)
}

# A value in a document: text without its quotes, nothing as "".
function said(name, key,    text, end) {
  text = document[name]
  if (!match(text, "\"" key "\":")) return "missing"
  text = substr(text, RSTART + RLENGTH)
  if (text !~ /^"/) {
    match(text, /^[^]},]*/)
    text = substr(text, 1, RLENGTH)
    return text == "null" ? "" : text
  }
  match(text, /^"([^"\\]|\\.)*"/)
  text = substr(text, 2, RLENGTH - 2)
  gsub(/\\"/, "\"", text)
  gsub(/\\\\/, "\\", text)
  return text
}

function expect(name, key, value, witness,    text) {
  text = said(name, key)
  if (text == value "") return
  printf "%s: the program says that \"%s\" is '%s', and %s '%s'\n", name, key, text, witness, value
  differs = 1
}

function mask_of(address,    bit, octet, mask) {
  sub(/.*\//, "", address)
  for (bit = 0; bit < 32; bit++) {
    octet = 2 * octet + (bit < address + 0)
    if (bit % 8 != 7) continue
    mask = mask (mask == "" ? "" : ".") octet
    octet = 0
  }
  return mask
}

function state(type) {
  if (type == "") return "no-adapter"
  if (type == "AP") return "access-point"
  if (type == "monitor") return type
  if (!now["up"]) return "down"
  if (!now["joined"]) return "disconnected"
  if (type == "IBSS") return "connected-adhoc"
  if (("supplicant's wpa_state" in now) && now["supplicant's wpa_state"] != "COMPLETED") return "joining"
  return "connected"
}

function check_status(type, radio,    connected) {
  expect("status", "state", state(type), "by the kernel it is")
  expect("status", "interface", "wlan0", "it is")
  expect("status", "ip", substr(now["address"], 1, index(now["address"], "/") - 1), "the kernel's is")
  expect("status", "mask", now["address"] ? mask_of(now["address"]) : "", "the kernel's is")
  expect("status", "radio", radio, "by the settings and the kernel it is")
  connected = state(type) ~ /^connected|^joining/
  expect("status", "name", connected ? now["joined name"] : "", "the kernel's is")
  expect("status", "mode", connected ? type == "IBSS" ? "ADHOC" : "MANAGED" : "", "by the kernel it is")
  if (state(type) == "connected") check_link()
  if (state(type) ~ /^(connected|joining)$/ && ("supplicant's wpa_state" in now)) check_supplicant()
}

function check_link() {
  expect("status", "access_point", now["joined"], "the kernel's is")
  expect("status", "channel", now["channel of wlan0"], "the kernel's is")
  expect("status", "signal_dbm", now["signal"], "the kernel's is")
  expect("status", "rate_kbps", now["rate"], "the kernel's is")
  expect("status", "gateway", now["gateway"], "the kernel's is")
  expect("status", "name_servers", servers, "the resolver's are")
}

function check_supplicant(    auth) {
  expect("status", "name", now["supplicant's ssid"], "the supplicant's is")
  expect("status", "state", now["supplicant's wpa_state"] == "COMPLETED" ? "connected" : "joining",
         "by the supplicant, which is in " now["supplicant's wpa_state"] ", it is")
  auth = now["supplicant's key_mgmt"]
  if (auth ~ /^WPA2?-PSK$/) sub(/-/, "", auth)
  if (auth ~ /^(WPA2?PSK)$/) expect("status", "auth", auth, "the supplicant's is")
}

function check_access_point(type,    name) {
  if (type == "") return expect("access-point", "reason", "no-adapter", "there is none:")
  if (model == "") return expect("access-point", "error", "the adapter has not been announced", "it is not noted:")
  if ("enable" in setting) expect("access-point", "enabled", setting["enable"] == "yes" ? "true" : "false", "as saved")
  if ("ssid" in setting) expect("access-point", "name", setting["ssid"], "the saved one is")
  name = now["name of wlan0"]
  if (type != "AP" || (name == "" && now["hostapd's state"] == "")) {
    expect("access-point", "state", "off", "by the kernel, where wlan0 is " type ", it is")
    return expect("access-point", "air_name", "", "the kernel has none:")
  }
  if (name == "") return expect("access-point", "state", now["hostapd's state"] == "DFS" ? "waiting-for-radar" : "off-by-schedule",
                                "by the kernel and hostapd, which is in " now["hostapd's state"] ", it is")
  expect("access-point", "state", "on-air", "by the kernel it is")
  expect("access-point", "air_name", name, "the kernel's is")
  expect("access-point", "air_name", now["hostapd's ssid[0]"], "hostapd's is")
  expect("access-point", "channel", now["channel of wlan0"], "the kernel's is")
  expect("access-point", "channel", now["hostapd's channel"], "hostapd's is")
  expect("access-point", "megahertz", now["megahertz of wlan0"], "the kernel's is")
  expect("access-point", "stations", now["stations"] + 0, "by the kernel there are")
  if (name != setting["ssid"] || (setting["channel"] && setting["channel"] != now["channel of wlan0"]))
    expect("access-point", "pending", "true", "the air and the settings are not the same:")
}

function check_radio(type, radio) {
  expect("radio", "radio", radio, "by the settings and the kernel it is")
  expect("radio", "kernel_block", now["block"], "the kernel's is")
  expect("radio", "adapter", model, "the hot-plug script has noted")
}

function check_known(    text, name, listed) {
  text = document["known"]
  while (match(text, /"name":"([^"\\]|\\.)*"/)) {
    name = substr(text, RSTART + 8, RLENGTH - 9)
    text = substr(text, RSTART + RLENGTH)
    listed[name] = 1
    if (name in saved) continue
    printf "known: the program lists '%s', which is not saved\n", name
    differs = 1
  }
  for (name in saved) {
    if (name in listed) continue
    printf "known: '%s' is saved, and the program does not list it\n", name
    differs = 1
  }
}

END {
  for (fact in former) if (former[fact] != now[fact]) exit 2
  for (fact in now) if (former[fact] != now[fact]) exit 2

  type = now["type of wlan0"]
  radio = "on"
  if (model == "" && section != "") radio = "unknown"  # nobody knows which section is the adapter's
  if (setting["unblock"] == "no" || now["block"] ~ /^(set|hardware)$/) radio = "off"
  check_status(type, radio)
  check_access_point(type)
  check_radio(type, radio)
  check_known()
  exit differs
}

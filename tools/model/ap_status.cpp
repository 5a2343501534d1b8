// What is so of the access point at this moment, by the kernel.
#include "model/ap_status.h"

#include <algorithm>
#include <ctime>
#include <string_view>

#include "common/paths.h"
#include "model/air.h"
#include "model/ap_files.h"
#include "model/stations.h"

namespace {

// Whether a schedule keeps its network off the air at this hour of the week.
bool IsOffNow(const MERO_WIFI_SCHED_CONF& schedule) {
  if (schedule.wifiSchedEnabled == 0) return false;
  const std::time_t now = std::time(nullptr);
  std::tm local{};
  ::localtime_r(&now, &local);
  constexpr std::size_t kHoursOfDay = 24;
  const std::string_view hours = schedule.szWifiSched;
  const auto hour = static_cast<std::size_t>(local.tm_wday) * kHoursOfDay + static_cast<std::size_t>(local.tm_hour);
  return hour < hours.size() && hours[hour] == '0';
}

ApState StateOf(const ApConf& conf) {
  const ApState state = ReadApState();
  return state == ApState::kDown && IsOffNow(conf.wifiSchedConf) ? ApState::kOffBySchedule : state;
}

struct StateText {
  ApState state;
  Tone tone;
  const char* szKey;
  const char* szText;
};

constexpr StateText kStateTexts[] = {
    {ApState::kOff, Tone::kFair, "off", "off"},
    {ApState::kDown, Tone::kBad, "interface-down", "off the air, since its interface is down"},
    {ApState::kOffBySchedule, Tone::kFair, "off-by-schedule", "off the air at this hour, by its schedule"},
    {ApState::kSettingUp, Tone::kFair, "setting-up", "being set up"},
    {ApState::kWaitingForRadar, Tone::kFair, "waiting-for-radar",
     "waiting until its channel is known to be free of radar"},
    {ApState::kOnAir, Tone::kGood, "on-air", "on the air"},
};

const StateText& TextOf(ApState state) {
  return *std::ranges::find(kStateTexts, state, &StateText::state);
}

Value KeyOf(const ApStatus& status) {
  return TextOf(status.state).szKey;
}

Shown ShowState(const ApStatus& status, bool) {
  const StateText& text = TextOf(status.state);
  return {text.szText, text.tone};
}

Shown ShowPending(const ApStatus& status, bool) {
  if (!status.isPending) return {"-", Tone::kFaint};
  return *status.isPending ? Shown{"saved, not yet on the air", Tone::kFair} : Shown{"as on the air"};
}

Value NumberOrNothing(int number) {
  return number != 0 ? Value(std::int64_t{number}) : nullptr;
}

constexpr Field<ApStatus> kFields[] = {
    {"state", "access point", KeyOf, Layout::kLeft, ShowState},
    {"name", "name", [](const ApStatus& of) { return Value(of.name); }},
    {"enabled", "enabled", [](const ApStatus& of) { return Value(of.enabled); }},
    {"interface", "interface", [](const ApStatus& of) { return Value(of.interface); }},
    {"air_name", "on air as", [](const ApStatus& of) { return of.nameOnAir.empty() ? nullptr : Value(of.nameOnAir); }},
    {"air_name_hex", "",
     [](const ApStatus& of) { return IsUtf8(of.nameOnAir) ? Value(nullptr) : Value(Hex(of.nameOnAir)); }},
    {"channel", "channel", [](const ApStatus& of) { return NumberOrNothing(of.channel); }},
    {"megahertz", "", [](const ApStatus& of) { return NumberOrNothing(of.megahertz); }},
    {"stations", "stations",
     [](const ApStatus& of) { return of.stations ? Value(std::int64_t{*of.stations}) : nullptr; }},
    {"pending", "settings", [](const ApStatus& of) { return of.isPending ? Value(*of.isPending) : nullptr; },
     Layout::kLeft, ShowPending},
};

}  // namespace

ApStatus ReadApStatus(const ApConf& conf) {
  ApStatus status;
  status.name = conf.hostapConf.szSSID;
  status.enabled = conf.blEnable != FALSE;
  status.interface = MEROWirelessAPInterfaceGet();
  const auto air = AirOf(status.interface);
  status.state = StateOf(conf);
  if (!status.isRunning() || !air) return status;
  status.nameOnAir = air->name;
  status.channel = air->channel;
  status.megahertz = air->megahertz;
  if (status.state == ApState::kOnAir) status.stations = CountStations();
  status.isPending = WasGivenOthers(status.interface, conf);
  return status;
}

std::span<const Field<ApStatus>> ApStatusFields() {
  return kFields;
}

std::string WhatBecameOf(const ApStatus& status) {
  switch (status.state) {
    case ApState::kOff:
      return "is off";
    case ApState::kDown:
      return "is off the air, since its interface is down";
    case ApState::kOffBySchedule:
      return "is off the air at this hour, by its schedule";
    case ApState::kSettingUp:
      return "is being set up";
    case ApState::kWaitingForRadar:
      return "waits until channel " + std::to_string(status.channel) + " is known to be free of radar";
    case ApState::kOnAir:
      return "is on the air" + (status.channel != 0 ? " on channel " + std::to_string(status.channel) : "");
  }
  return "";
}

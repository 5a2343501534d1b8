// The document of `merowireless import`: whatever the text is, it is refused in words that steer no terminal, or what
// it holds can be saved, is read back as it was, and is written as a document that holds the same. What the program
// keeps of a network beside the library, such as name servers, is not followed so far.
//
// Runs: 4000
// Covers: tools/model/settings_document.cpp
#include "model/settings_document.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>

#include "base/text.h"
#include "common/paths.h"
#include "tests/fuzz/support.h"

namespace {

// Calls something that may refuse what it is given; whether it did not.
template <class Act>
bool Accepts(Act act, const std::string& text) {
  try {
    act();
    return true;
  } catch (const Failure& why) {
    for (const std::string& said : {std::string(why.what()), why.advice()}) {
      const bool isPlain = std::ranges::all_of(said, [](char c) { return c >= ' ' && c <= '~'; });
      Require(!said.empty() && isPlain, "a refusal steers no terminal", {said, text});
    }
    return false;
  }
}

SettingsDocument ReadAgain(const std::string& document) {
  SettingsDocument read;
  Require(Accepts([&] { read = DocumentIn(document); }, document), "a document that was written is read", {document});
  return read;
}

// What a document tells of a network, but for the time and for what the program keeps beside the library.
std::string Described(const KnownNetwork& of) {
  std::string text;
  const Network& network = of.network;
  for (const std::string& field : {EndedText(network.szEssid), EndedText(of.szKey), EndedText(of.szIp),
                                   EndedText(of.szMask), EndedText(of.szGateway), AddressText(network.bssid)}) {
    text += field + "|";
  }
  for (const int value : {int{network.opmode}, int{network.auth}, int{network.encrypt}}) text += std::to_string(value);
  return text;
}

std::string Described(const ApConf& conf) {
  return DocumentOf({}, conf, Secrets::kIncluded);
}

// As the library has it.
KnownNetwork SavedLike(const DocumentedNetwork& of, const std::string& text) {
  KnownNetwork saved{};
  Require(MEROWirelessConfGet(AddressText(of.network.network.bssid).c_str(), &saved) == 0,
          "a network that was saved is there", {text});
  Require(Described(saved) == Described(of.network), "a network is saved as the document has it",
          {Described(of.network), Described(saved), text});
  return saved;
}

void CheckNetworks(const std::vector<DocumentedNetwork>& documented, const std::string& text) {
  RemoveFile(kKnownNetworksPath);
  for (const DocumentedNetwork& each : documented) {
    Require(MEROWirelessConfSet(&each.network) == 0, "a network of a document can be saved", {text});
    Require(each.extras.priority >= 0 && each.extras.priority <= kGreatestPriority, "a priority is in its bounds",
            {text});
  }
  std::vector<KnownNetwork> saved;
  saved.reserve(documented.size());
  for (const DocumentedNetwork& each : documented) saved.push_back(SavedLike(each, text));

  const std::string written = DocumentOf(saved, std::nullopt, Secrets::kIncluded);
  const SettingsDocument again = ReadAgain(written);
  Require(std::ranges::equal(again.networks, saved,
                             [](const DocumentedNetwork& one, const KnownNetwork& other) {
                               return Described(one.network) == Described(other);
                             }),
          "a document that was written has the same networks", {written, text});
}

// The settings of an appliance that has none yet.
ApConf Defaults() {
  PutFile(kAdapterInfoPath, "PRODUCT=model\n");
  RemoveFile(kApSettingsPath);
  ApConf conf = ReadApSettings();
  conf.blEnable = TRUE;  // of one that is not enabled, that alone is saved
  return conf;
}

void CheckAp(const DocumentedAp& documented, const std::string& text) {
  ApConf conf = Defaults();
  if (!Accepts([&] { SetAp(conf, documented); }, text)) return;
  const std::string written = Described(conf);
  ApConf again = Defaults();
  Require(Accepts([&] { SetAp(again, *ReadAgain(written).ap); }, written) && Described(again) == written,
          "a document that was written has the same access point", {written, Described(again), text});
  Require(MEROWirelessSetAPConfig(&conf) != FALSE, "an access point of a document can be saved", {written, text});
  ApConf loaded{};
  Require(ReadSavedAp(loaded) && Described(loaded) == written, "an access point is saved as the document has it",
          {written, Described(loaded), text});
}

}  // namespace

// Whether there is a section already, the library asks a command: there is none.
extern "C" FILE* popen(const char* szCommand, const char*) {
  Require(std::strncmp(szCommand, "grep -i \"", 9) == 0, "nothing else is run", {szCommand});
  static char szNothing[] = "";
  return ::fmemopen(szNothing, sizeof szNothing, "r");
}

extern "C" int pclose(FILE* stream) {
  return std::fclose(stream);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  SettingsDocument document;
  if (!Accepts([&] { document = DocumentIn(text); }, text)) return 0;
  CheckNetworks(document.networks, text);
  if (document.ap) CheckAp(*document.ap, text);
  return 0;
}

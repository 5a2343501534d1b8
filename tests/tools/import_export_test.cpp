// What one appliance knows goes to another one, as a document.
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <filesystem>
#include <functional>
#include <nlohmann/json.hpp>

#include "real_store.h"
#include "running.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

constexpr char kPath[] = "/usr/mero/etc/wireless.conf";
constexpr char kFile[] = "/tmp/documents/settings.json";

constexpr char kStore[] =
    "# by hand\n"
    "[0A:0A:0A:0A:0A:0A]\n"
    "\tKEY=open sesame\n"
    "\tIPADDR=DHCP\n"
    "\tNETMASK=\n"
    "\tGATEWAY=\n"
    "\tESSID=Home\n"
    "\tBSSID=0A:0A:0A:0A:0A:0A\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86400\n"
    "\tAUTH=WPA2PSK\n"
    "\tENCRYPT=AES\n"
    "\tCOLOUR= blue \n"
    "\tPRIORITY=7\n"
    "\n"
    "[0A:0A:0A:0A:0A:0C]\n"
    "\tKEY=\n"
    "\tIPADDR=10.0.0.5\n"
    "\tNETMASK=255.255.255.0\n"
    "\tGATEWAY=10.0.0.1\n"
    "\tESSID=caf\xE9\n"
    "\tBSSID=0A:0A:0A:0A:0A:0C\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86200\n"
    "\tAUTH=OPEN\n"
    "\tENCRYPT=NONE\n"
    "\tDNS=1.1.1.1 8.8.8.8\n"
    "\tAUTOJOIN=no\n";

std::function<bool(int)> g_flushFails;

class Export : public ToolTest {
 protected:
  Export() {
    UseRealStore();
    Shell("rm -rf /tmp/documents; mkdir /tmp/documents");
    WriteText(kPath, kStore);
  }

  static json Exported(std::vector<std::string> options = {}) {
    options.insert(options.begin(), "export");
    const Ran ran = Tool(options);
    EXPECT_EQ(ran.status, 0) << ran.err;
    return json::parse(ran.out);
  }
};

TEST_F(Export, TellsEachNetworkWithWhatIsSavedOfIt) {
  const json document = Exported();
  EXPECT_EQ(document["version"], 1);
  EXPECT_EQ(document["networks"], json::parse(R"([
    {"name": "Home", "address": "0A:0A:0A:0A:0A:0A", "auth": "WPA2PSK", "encryption": "AES", "mode": "MANAGED",
     "ip": "DHCP", "mask": null, "gateway": null, "name_servers": null, "priority": 7, "autojoin": true,
     "saved": "1970-01-02T00:00:00Z"},
    {"name": {"hex": "636166e9"}, "address": "0A:0A:0A:0A:0A:0C", "auth": "OPEN", "encryption": "NONE",
     "mode": "MANAGED", "ip": "10.0.0.5", "mask": "255.255.255.0", "gateway": "10.0.0.1",
     "name_servers": "1.1.1.1 8.8.8.8", "priority": 0, "autojoin": false, "saved": "1970-01-01T23:56:40Z"}])"));
}

TEST_F(Export, TellsTheAccessPointsSettingsButNotItsSwitch) {
  EXPECT_TRUE(Exported()["access_point"].is_null());
  library::SavedAp(library::Office());
  const json ap = Exported()["access_point"];
  EXPECT_EQ(ap["ssid"], "Office");
  EXPECT_EQ(ap["encryption"], "wpa2");
  EXPECT_EQ(ap["channel"], 6);
  EXPECT_EQ(ap["wmm_enabled"], true);
  for (const char* szKey : {"enable", "has_secret", "secret", "guest_net_secret"}) EXPECT_FALSE(ap.contains(szKey));
  EXPECT_TRUE(Exported({"--networks"})["access_point"].is_null());
}

TEST_F(Export, TellsSecretsOnlyWhenAskedTo) {
  library::SavedAp(library::Office());
  EXPECT_THAT(Tool({"export"}).out, Not(HasSubstr("open sesame")));
  const json document = Exported({"--secrets"});
  EXPECT_EQ(document["networks"][0]["secret"], "open sesame");
  EXPECT_TRUE(document["networks"][1]["secret"].is_null());
  EXPECT_EQ(document["access_point"]["secret"], "open sesame");
}

TEST_F(Export, IsTheSameInAllFormsAndOneLineInJson) {
  const std::string document = Tool({"export"}).out;
  EXPECT_EQ(Tool({"export", "-"}).out, document);
  EXPECT_EQ(Tool({"export", "--porcelain"}).out, document);
  const std::string line = Tool({"export", "--json"}).out;
  EXPECT_EQ(json::parse(line), json::parse(document));
  EXPECT_EQ(line.find('\n'), line.size() - 1);
}

TEST_F(Export, HoldsNothingThatATerminalActsUpon) {
  WriteText(kPath, "[0A:0A:0A:0A:0A:0A]\n\tESSID=a\xC2\x9BJ\x7F\x1B[\n\tBSSID=0A:0A:0A:0A:0A:0A\n\tAUTH=OPEN\n");
  EXPECT_THAT(Tool({"export"}).out, HasSubstr(R"("name": "a\u009bJ\u007f\u001b[",)"));
  EXPECT_EQ(Exported()["networks"][0]["name"], "a\u009bJ\u007f\u001b[");
}

TEST_F(Export, IntoAFileIsReadableByItsOwnerAlone) {
  for (const bool isThere : {false, true}) {
    if (isThere) WriteText(kFile, "old", 0644);
    const Ran ran = Tool({"export", "--secrets", kFile}, {.before = [] { ::umask(0); }});
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_EQ(ran.out,
              "/tmp/documents/settings.json holds 2 known networks, with their secrets: whoever reads it can "
              "join\n");
    EXPECT_EQ(Shell("stat -c %a /tmp/documents/settings.json; ls -A /tmp/documents"), "600\nsettings.json\n");
    EXPECT_EQ(ReadText(kFile), Tool({"export", "--secrets"}).out);
  }
  library::SavedAp(library::Office());
  EXPECT_EQ(Tool({"export", kFile}).out,
            "/tmp/documents/settings.json holds 2 known networks and the access point's settings, without secrets\n");
  EXPECT_EQ(Tool({"export", kFile, "--json"}).out,
            R"({"result":"ok","export":{"file":"/tmp/documents/settings.json","networks":2,"access_point":true,)"
            R"("secrets":false}})"
            "\n");
  EXPECT_EQ(Tool({"export", kFile, "--porcelain"}).out, "/tmp/documents/settings.json\t2\tyes\tno\n");
}

TEST_F(Export, ReplacesNothingButAPlainFile) {
  std::filesystem::create_symlink("/tmp/elsewhere", kFile);
  const Ran ran = Tool({"export", kFile});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/tmp/documents/settings.json is no plain file, and was not replaced: "));
  EXPECT_FALSE(std::filesystem::exists("/tmp/elsewhere"));
}

TEST_F(Export, WithoutAnAdapterLeavesTheAccessPointOutAndSaysSo) {
  library::SavedAp(library::Office());
  library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; };
  const Ran ran = Tool({"export"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.err, "merowireless: the access point's settings are left out, since no adapter has been announced\n");
  EXPECT_TRUE(json::parse(ran.out)["access_point"].is_null());
  EXPECT_EQ(json::parse(ran.out)["networks"].size(), 2U);
  EXPECT_EQ(Tool({"export", "--networks"}).err, "");
}

class Import : public Export {
 protected:
  Import() {
    library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) {
      library::Record(std::string("saves ") + conf->hostapConf.szSSID + (conf->blEnable != FALSE ? " on" : " off"));
      return TRUE;
    };
  }

  static Ran Imported(const std::string& document, std::vector<std::string> options = {}) {
    options.insert(options.begin(), {"import", "-"});
    return Tool(options, {.input = document});
  }

  static std::string Networks(const std::string& networks) { return R"({"version":1,"networks":[)" + networks + "]}"; }

  static std::string Network(const std::string& more, const std::string& address = "0A:0A:0A:0A:0A:0E") {
    return R"({"name":"Attic","auth":"WPA2PSK","encryption":"AES","address":")" + address + "\"" + more + "}";
  }

  // Says where the document is wrong, and that nothing was changed.
  static void ExpectRefused(const std::string& document, const std::string& why, int status = 2) {
    const Ran ran = Imported(document);
    EXPECT_EQ(ran.status, status) << document.substr(0, 200) << ran.err;
    EXPECT_THAT(ran.err, HasSubstr("merowireless: " + why)) << document.substr(0, 200);
    EXPECT_EQ(ran.out, "");
    EXPECT_EQ(ReadText(kPath), kStore);
    EXPECT_EQ(Shell("ls -A /usr/mero/etc | grep edit || :"), "");
  }
};

TEST_F(Import, MakesAnotherApplianceKnowTheSame) {
  const std::string document = Tool({"export", "--secrets"}).out;
  std::filesystem::remove(kPath);
  const Ran ran = Imported(document);
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out,
            "SETTINGS  NAME     ACCESS POINT       CHANGE  SECRET\n"
            "network   Home     0A:0A:0A:0A:0A:0A  added   imported\n"
            "network   caf\\xe9  0A:0A:0A:0A:0A:0C  added   -\n");
  EXPECT_EQ(Tool({"export", "--secrets"}).out, document);
  EXPECT_EQ(Shell("stat -c %a /usr/mero/etc/wireless.conf; ls -A /usr/mero/etc"), "600\nwireless.conf\n");
}

TEST_F(Import, ChangesOnlyWhatDiffersAndKeepsSecretsAndOtherLines) {
  json document = Exported();
  document["networks"][0]["priority"] = 9;
  const Ran ran = Imported(document.dump(), {"--porcelain"});
  EXPECT_EQ(ran.out,
            "network\tHome\t\t0A:0A:0A:0A:0A:0A\tchanged\tkept\n"
            "network\tcaf\\0351\t636166e9\t0A:0A:0A:0A:0A:0C\tsame\t\n");
  std::string changed = kStore;
  changed.replace(changed.find("PRIORITY=7"), 10, "PRIORITY=9");
  EXPECT_EQ(ReadText(kPath), changed);
}

TEST_F(Import, WithDryRunSaysTheSameAndChangesNothing) {
  const std::string document = Networks(Network(""));
  const Ran dry = Imported(document, {"--dry-run"});
  EXPECT_THAT(dry.err, HasSubstr("merowireless: nothing was changed: this is what would be imported\n"));
  EXPECT_EQ(ReadText(kPath), kStore);
  const Ran ran = Imported(document);
  EXPECT_EQ(ran.out, dry.out);
  EXPECT_THAT(ReadText(kPath), HasSubstr("[0A:0A:0A:0A:0A:0E]\n\tKEY=\n\tIPADDR=DHCP\n"));
  EXPECT_EQ(ran.err, "merowireless: a network whose secret is missing needs it from `merowireless edit NAME --key`\n");
  EXPECT_THAT(Imported(document, {"--json"}).out, HasSubstr(R"("change":"same","secret":"missing"}]})"));
}

TEST_F(Import, RefusesWhatCannotBeSavedAndNamesThePlace) {
  const std::pair<std::string, std::string> rows[] = {
      {R"(,"ip":"10.0.0.0","mask":"255.255.255.0")", "networks[1].ip: no host can have this address: "},
      {R"(,"ip":"10.0.0.4","mask":"255.255.255.0","gateway":"10.0.1.1")", "networks[1].ip: the gateway is not in "},
      {R"(,"ip":true)", "networks[1].ip: this is no text: "},
      {R"(,"priority":1001)", "networks[1].priority: no network has this priority: "},
      {R"(,"priority":"5")", "networks[1].priority: this is no whole number: "},
      {R"(,"priority":99999999999999999999)", "networks[1].priority: this is no whole number: "},
      {R"(,"autojoin":"no")", "networks[1].autojoin: this is no truth value: "},
      {R"(,"name_servers":"home")", "networks[1].name_servers: these can be no name servers: "},
      {R"(,"saved":"yesterday")", "networks[1].saved: this is no time: "},
      {R"(,"mode":"MONITOR")", "networks[1].mode: networks have no such mode: "},
      {R"(,"colour":"blue")", "networks[1].colour: networks have no such key: "},
      {R"(,"secret":{"hex":"6g"})", "networks[1].secret: these are no bytes: "},
      {R"(,"secret":{"bytes":"66"})", "networks[1].secret: this object is no text: "},
      {R"(,"secret":"open\nsesame")", "networks[1].secret: the secret cannot be used: "},
      {R"(,"secret":"open\u0000sesame")", "networks[1].secret: the secret cannot be used: "},
      {",\"secret\":\"" + std::string(2000, 'x') + "\"", "networks[1].secret: the text is too long: "},
  };
  for (const auto& [more, why] : rows) {
    ExpectRefused(Networks(Network("", "0A:0A:0A:0A:0A:0D") + "," + Network(more)), "the document is wrong at " + why);
  }
  ExpectRefused(Networks(Network(R"(,"secret":"short")")),
                "the document is wrong at networks[0]: this can be no passphrase", 5);
  const std::pair<const char*, const char*> records[] = {
      {R"({"name":"a","auth":"OPEN","encryption":"NONE"})", "networks[0]: a network lacks a key: address"},
      {R"({"name":"","auth":"OPEN","encryption":"NONE","address":"0A:0A:0A:0A:0A:0E"})", "networks[0].name: "},
      {R"({"name":"a\u0000b","auth":"OPEN","encryption":"NONE","address":"0A:0A:0A:0A:0A:0E"})", "networks[0].name: "},
      {R"({"name":"a\nb","auth":"OPEN","encryption":"NONE","address":"0A:0A:0A:0A:0A:0E"})", "networks[0].name: "},
      {R"({"name":"a","auth":"WPA9","encryption":"NONE","address":"0A:0A:0A:0A:0A:0E"})",
       "networks[0].auth: networks are not protected like this: "},
      {R"({"name":"a","auth":"OPEN","encryption":"ROT13","address":"0A:0A:0A:0A:0A:0E"})",
       "networks[0].encryption: networks are not enciphered like this: "},
      {R"({"name":"a","auth":"WPANONE","encryption":"AES","address":"0A:0A:0A:0A:0A:0E"})",
       "networks[0]: networks that are protected so cannot be joined: "},
      {R"({"name":"a","auth":"OPEN","encryption":"NONE","address":"01:0A:0A:0A:0A:0E"})",
       "networks[0].address: this is no address of an access point: "},
      {"7", "networks[0]: this is no network: "},
  };
  for (const auto& [record, why] : records)
    ExpectRefused(Networks(record), std::string("the document is wrong at ") + why);
  ExpectRefused(Networks(Network("") + "," + Network("")),
                "the document is wrong at networks[1].address: another network of the document has this address: ");
}

TEST_F(Import, RefusesWhatIsNoDocument) {
  const std::pair<std::string, std::string> rows[] = {
      {"", "the document is no JSON at line 1: "},
      {"{\n\"version\": 1,\n oops}", "the document is no JSON at line 3: "},
      {"{\"version\":1,\"networks\":\"\xff\"}", "the document is no JSON at line 1: "},
      {R"({"version":1e999})", "the document holds a number that is too great: "},
      {"[]", "this is no document of settings: "},
      {R"({"networks":[]})", "this is no document of settings: "},
      {R"({"version":2})", "the document is of another version: "},
      {R"({"version":"1"})", "the document is of another version: "},
      {R"({"version":1})", "the document has nothing to import: "},
      {R"({"version":1,"colour":"blue"})", "the document is wrong at colour: documents have no such key: "},
      {R"({"version":1,"version":1})", "the document has a key twice in one object: version: "},
      {Networks(R"({"name":"a","name":"b"})"), "the document has a key twice in one object: name: "},
      {R"({"version":1,"networks":{}})", "the document is wrong at networks: this is no list: "},
      {std::string(100000, '['), "the document is nested too deeply: "},
      {R"({"version":1)" + std::string(1 << 20, ' ') + "}", "the document is too long: "},
  };
  for (const auto& [document, why] : rows) ExpectRefused(document, why);
  std::string many = "7";
  for (int i = 0; i < 1000; ++i) many += ",7";
  ExpectRefused(Networks(many), "the document is wrong at networks: there are too many networks: ");
  EXPECT_THAT(Tool({"import", "/tmp/nowhere"}).err,
              HasSubstr("the document cannot be read from /tmp/nowhere: No such file or directory: "));
}

TEST_F(Import, OfANetworkWhoseSectionHasAnotherNameIsRefused) {
  std::string store = kStore;
  store.replace(store.find("[0A:0A:0A:0A:0A:0A]"), 19, "[elsewhere]");
  WriteText(kPath, store);
  EXPECT_THAT(Imported(Networks(Network("", "0A:0A:0A:0A:0A:0A"))).err,
              HasSubstr("networks[0]: the network is saved in a section that is not named by its address: "));
  EXPECT_EQ(ReadText(kPath), store);
}

TEST_F(Import, ThatFindsNoRoomChangesNothing) {
  library::PLIBCFileSetSectionValue = [](auto&&...) { return -1; };
  json document = Exported();
  document["networks"][0]["priority"] = 9;
  const Ran ran = Imported(document.dump());
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ReadText(kPath), kStore);
  EXPECT_EQ(Shell("ls -A /usr/mero/etc"), "wireless.conf\n");
}

TEST_F(Import, ThatFindsNoRoomForANewNetworkChangesNothing) {
  const auto limit = [] {
    const rlimit most{sizeof kStore + 20, sizeof kStore + 20};
    ::setrlimit(RLIMIT_FSIZE, &most);
    ::signal(SIGXFSZ, SIG_IGN);
  };
  const Ran ran = Tool({"import", "-"}, {.input = Networks(Network("")), .before = limit});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("a network could not be added, and nothing was imported: "));
  EXPECT_EQ(ReadText(kPath), kStore);
  EXPECT_EQ(Shell("ls -A /usr/mero/etc"), "wireless.conf\n");
}

// ---- The access point's settings ----

constexpr char kOfficeNow[] =
    R"({"version":1,"access_point":{"ssid":"Shop","channel":11,"wifi_sched":null,"max_num_sta":9,"wmm_enabled":false}})";

TEST_F(Import, OfTheAccessPointKeepsTheRestAndItsSwitch) {
  library::SavedAp(library::Office());
  const Ran ran = Imported(kOfficeNow, {"--porcelain"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "access-point\tShop\t\t\tchanged\tkept\n");
  EXPECT_THAT(ran.err, HasSubstr("merowireless: `merowireless ap enable` puts the imported settings on the air\n"));
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: the imported channel could not be checked: no radio is there to tell\n"));
  EXPECT_THAT(library::Calls(), testing::IsSupersetOf({"saves Shop on", "saves Shop off"}));
  EXPECT_THAT(library::Calls(), Not(testing::Contains("MEROWirelessAPEnable")));
}

TEST_F(Import, OfTheAccessPointAsItIsSavesNothing) {
  library::SavedAp(library::Office());
  const std::string document = Tool({"export", "--secrets"}).out;
  EXPECT_THAT(Imported(document, {"--porcelain"}).out, HasSubstr("access-point\tOffice\t\t\tsame\timported\n"));
  EXPECT_THAT(library::Calls(), Not(testing::Contains("MEROWirelessSetAPConfig")));
}

TEST_F(Import, OfTheAccessPointRefusesWhatItsOptionsRefuse) {
  library::SavedAp(library::Office());
  const std::pair<const char*, const char*> rows[] = {
      {R"({"channel":15})", "access_point: there is no such channel in the 2.4 GHz band"},
      {R"({"channel":true})", "access_point.channel: this setting is of another type: "},
      {R"({"hw_mode":"an"})", "access_point.hw_mode: this is no mode of the 2.4 GHz band"},
      {R"({"wifi_sched":"/etc/passwd"})", "access_point.wifi_sched: the schedule is not 168 hours"},
      {R"({"enable":true})", "access_point.enable: access points have no such setting: "},
      {R"({"encryption":"wep"})", "access_point: this security needs a secret"},
      {R"(7)", "access_point: these are no settings: "},
  };
  for (const auto& [ap, why] : rows) {
    ExpectRefused(R"({"version":1,"networks":[)" + Network("") + R"(],"access_point":)" + ap + "}",
                  std::string("the document is wrong at ") + why);
  }
  EXPECT_THAT(library::Calls(), Not(testing::Contains("MEROWirelessSetAPConfig")));
}

TEST_F(Import, ThatCannotSaveTheAccessPointLeavesAllAsItWas) {
  library::SavedAp(library::Office());
  WriteText("/usr/mero/etc/wireless_ap.conf", "former\n", 0640);
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) {
    WriteText("/usr/mero/etc/wireless_ap.conf", "half\n");
    return conf->blEnable;
  };
  json document = json::parse(kOfficeNow);
  document["networks"] = json::array({json::parse(Network(""))});
  g_flushFails = [](int) {
    Shell("ls -A /usr/mero/etc >>/tmp/beside");
    return false;
  };
  EXPECT_THAT(Imported(document.dump()).err, HasSubstr("the settings could not be saved: "));
  g_flushFails = nullptr;
  EXPECT_THAT(ReadText("/tmp/beside"), HasSubstr(".wireless_ap.conf.edit\n")) << "what a kill leaves is to have a name";
  EXPECT_EQ(ReadText("/usr/mero/etc/wireless_ap.conf"), "former\n");
  EXPECT_EQ(Shell("stat -c %a /usr/mero/etc/wireless_ap.conf"), "640\n");
  EXPECT_EQ(ReadText(kPath), kStore);
  std::filesystem::remove("/usr/mero/etc/wireless_ap.conf");
}

// The networks were the new ones, and the access point was put back.
TEST_F(Import, ThatMayNotOutlastAPowerCutIsWholeAllTheSame) {
  library::SavedAp(library::Office());
  WriteText("/usr/mero/etc/wireless_ap.conf", "former\n");
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF) {
    WriteText("/usr/mero/etc/wireless_ap.conf", "new\n");
    return TRUE;
  };
  json document = json::parse(kOfficeNow);
  document["networks"] = json::array({json::parse(Network(""))});
  g_flushFails = [](int fd) {
    return std::filesystem::is_directory("/proc/self/fd/" + std::to_string(fd)) &&
           !std::filesystem::exists("/usr/mero/etc/.wireless.conf.edit");
  };
  const auto ran = Imported(document.dump());
  g_flushFails = nullptr;
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/usr/mero/etc/wireless.conf is changed, but may be the old one again after a power "
                                 "cut: Input/output error: "));
  EXPECT_EQ(ReadText("/usr/mero/etc/wireless_ap.conf"), "new\n");
  EXPECT_THAT(ReadText(kPath), HasSubstr("\tESSID=Attic\n"));
  std::filesystem::remove("/usr/mero/etc/wireless_ap.conf");
}

TEST_F(Import, OfTheAccessPointNeedsItsFormerSettingsAndSaysWhenTheyAreLost) {
  static constexpr char kApPath[] = "/usr/mero/etc/wireless_ap.conf";
  library::SavedAp(library::Office());
  std::filesystem::create_directory(kApPath);
  EXPECT_THAT(Imported(kOfficeNow).err,
              HasSubstr("the access point's settings cannot be read, and nothing was imported: "));
  EXPECT_THAT(library::Calls(), Not(testing::Contains("MEROWirelessSetAPConfig")));
  std::filesystem::remove(kApPath);
  WriteText(kApPath, "former\n");
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF) {
    std::filesystem::remove(kApPath);
    std::filesystem::create_directory(kApPath);
    return FALSE;
  };
  EXPECT_THAT(Imported(kOfficeNow).err,
              HasSubstr("the networks could not be imported, and the access point's settings not be put back: "));
  std::filesystem::remove(kApPath);
}

TEST_F(Import, WithoutAnAdapterTakesTheNetworksAloneWhenToldTo) {
  library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; };
  json document = json::parse(kOfficeNow);
  document["networks"] = json::array({json::parse(Network(""))});
  ExpectRefused(document.dump(), "the access point's settings are an adapter's, and none has been announced: ", 1);
  EXPECT_EQ(Imported(document.dump(), {"--networks"}).status, 0);
  EXPECT_THAT(ReadText(kPath), HasSubstr("\tESSID=Attic\n"));
}

}  // namespace

// The program's calls, and the platform's, go through this one.
extern "C" int fsync(int fd) {
  if (!g_flushFails || !g_flushFails(fd)) return static_cast<int>(::syscall(SYS_fsync, fd));
  errno = EIO;
  return -1;
}

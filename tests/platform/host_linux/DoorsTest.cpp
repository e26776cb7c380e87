// The doors to the hardware, as far as they can fail on a machine without any: refusals, wrong requests, what is no
// device, and an adapter of a network of its own.
#include <gtest/gtest.h>
#include <net/if.h>
#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "platform/DriverRecords.h"
#include "platform/host_linux/ChildProcess.h"
#include "platform/host_linux/KernelTree.h"
#include "platform/host_linux/LinuxCameras.h"
#include "platform/host_linux/LinuxConnections.h"
#include "platform/host_linux/LinuxDriver.h"
#include "platform/host_linux/LinuxKeyboard.h"
#include "platform/host_linux/LinuxRawDisks.h"
#include "platform/host_linux/MemoryMap.h"

namespace panelglow::platform::host_linux {
namespace {

std::string ToldBy(const std::function<void()>& action) {
  testing::internal::CaptureStderr();
  action();
  return testing::internal::GetCapturedStderr();
}

// ---- the driver

TEST(LinuxDriver, RefusesRequestsThatItCannotRead) {
  struct Row {
    const char* what;
    std::uint32_t code;
    std::size_t in;
    std::size_t out;
    std::vector<std::pair<std::size_t, std::uint64_t>> fields;  // offset, 4 bytes
    std::uint32_t error;
  };
  const std::vector<Row> rows{
      {"version", driver::kGetVersion, 0, 4, {}, 0},
      {"unknown code", 0x222900, 12, 12, {}, 1},
      {"short port request", driver::kInportByte, 8, 4, {{4, 1}}, 87},
      {"short port answer", driver::kInportByte, 12, 2, {{4, 1}}, 87},
      {"width of another code", driver::kOutportWord, 12, 12, {{4, 1}}, 87},
      {"short PCI request", driver::kReadPciConfigByte, 12, 16, {}, 87},
      {"short search", driver::kFindPciClass, 16, 12, {}, 87},
      {"map record of no word size", driver::kMapPhysicalMemory, 36, 36, {}, 87},
      {"map answer of another word size", driver::kMapPhysicalMemory, 40, 20, {}, 87},
      {"nothing to map", driver::kMapPhysicalMemory, 20, 20, {{0, 0xFED10000}}, 87},
      {"2 GiB to map", driver::kMapPhysicalMemory, 40, 40, {{0, 0xFED10000}, {8, 0x80000000}}, 87},
      {"the kernel's own RAM", driver::kMapPhysicalMemory, 40, 40, {{0, 0x50100}, {8, 4}}, 5},
      {"mapping over the end", driver::kMapPhysicalMemory, 40, 40, {{0, 0xFFFFFFFF}, {4, 0xFFFFFFFF}, {8, 2}}, 87},
      {"unmap of what is none", driver::kUnmapPhysicalMemory, 20, 20, {{8, 0x1000}}, 87},
      {"short register request", driver::kReadMsr, 4, 8, {}, 87},
      {"short firmware request", driver::kReadFirmwareWord, 4, 2, {}, 87}};
  LinuxDriver linux_driver;
  std::uint32_t error = 0;
  EXPECT_EQ(linux_driver.Open("tmbhalcyon64", error), nullptr);
  EXPECT_EQ(error, 2U);
  const auto device = linux_driver.Open("tmbhalcyon", error);
  ASSERT_NE(device, nullptr);
  EXPECT_EQ(error, 0U);
  for (const Row& row : rows) {
    std::vector<std::byte> in(row.in);
    std::vector<std::byte> out(row.out);
    for (const auto& [offset, value] : row.fields) {
      driver::PutNumber(in, offset, 4, value);
    }
    const std::string told = ToldBy([&] { error = device->Control(row.code, in, out); });
    EXPECT_EQ(told.find("0x50100 is RAM") != std::string::npos, row.error == 5) << row.what << told;
    EXPECT_EQ(told.empty(), row.error != 5) << row.what;
    EXPECT_EQ(error, row.error) << row.what;
  }
}

TEST(LinuxDriver, WithoutRightsItsServiceIsRefusedAndPeopleAreToldOnce) {
  int asExpected = 0;
  const std::string told = ToldBy([&] {
    ChildProcess child([](int) {
      constexpr uid_t kNobody = 65534;
      if (::geteuid() == 0 && ::setresuid(kNobody, kNobody, kNobody) != 0) {
        return 90;
      }
      LinuxDriver services;
      std::uint32_t error = 0;
      const ServiceHandle manager = services.OpenManager(0, error);
      std::vector<std::uint32_t> got{error};
      const ServiceHandle service = services.OpenService(manager, "tmbhalcyon", 0, error);
      got.insert(got.end(), {error, services.Start(service), services.Start(service), services.Start(0)});
      services.OpenService(manager, "another", 0, error);
      got.push_back(error);
      services.OpenService(0, "tmbhalcyon", 0, error);
      got.push_back(error);
      services.CreateService(manager, {}, error);
      got.push_back(error);
      std::array<std::byte, 12> in{};
      std::array<std::byte, 4> out{};
      driver::PutNumber(in, 4, 4, 1);
      got.push_back(services.Open("tmbhalcyon", error)->Control(driver::kInportByte, in, out));
      const std::vector<std::uint32_t> expected{0, 0, 5, 5, 6, 1060, 6, 5, 5};
      return static_cast<int>(std::mismatch(got.begin(), got.end(), expected.begin()).first - got.begin());
    });
    asExpected = child.Wait();
  });
  EXPECT_EQ(asExpected, 9) << "is the place of the first call that answered something else";
  EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1) << told;
  EXPECT_NE(told.find(": There is no way to the hardware (I/O ports: "), std::string::npos) << told;
}

TEST(PciConfiguration, KnowsTheFunctionsOfItsDomainAndTheRegistersThatTheKernelShows) {
  const KernelTree tree;
  for (const char* name : {"0000:01:00.1", "0000:00:1f.3", "0001:00:00.0", "10000:00:00.0"}) {
    tree.Put(std::string("devices/") + name + "/config", std::string(62, '\0') + "\x34\x12");
  }
  const PciConfiguration pci(tree.At("devices"));
  EXPECT_EQ(pci.Functions(), (std::vector<std::uint16_t>{0x00FB, 0x0101}));
  EXPECT_EQ(pci.Read(0x0101, 62, 2), 0x1234U);
  EXPECT_EQ(pci.Read(0x0101, 62, 4), std::nullopt);
  EXPECT_EQ(pci.Read(0x0200, 0, 1), std::nullopt);
  EXPECT_EQ(pci.Write(0x0200, 0, 1, 0), ENOENT);
  EXPECT_EQ(pci.Write(0x00FB, 60, 2, 0xBEEF), 0);
  EXPECT_EQ(pci.Read(0x00FB, 60, 4), 0x1234BEEFU);
}

TEST(MemoryMap, TellsRamAndNobodysRangesFromDevices) {
  const MemoryMap map(
      "00000000-00000fff : Reserved\n"
      "00001000-0009fbff : System RAM\n"
      "000f0000-000fffff : System ROM\n"
      "not a range\n"
      "40000000-3fffffff : turned round\n"
      "00100000-3ffdffff : System RAM\n"
      "  01000000-01ffffff : Kernel code\n"
      "80000000-febfffff : PCI Bus 0000:00\n"
      "  fea00000-fea00fff : 0000:00:1b.0\n"
      "    fea00000-fea00fff : ICH HD audio\n"
      "fed00000-fed003ff : HPET 0\n"
      "100000000-1ffffffff : System RAM");
  struct Row {
    std::uint64_t first;
    std::uint64_t length;
    MemoryOwner owner;
  };
  for (const Row& row : {Row{0x400, 4, MemoryOwner::kDevice}, Row{0x2000, 1, MemoryOwner::kRam},
                         Row{0xFFC, 8, MemoryOwner::kRam}, Row{0xFFC, 4, MemoryOwner::kDevice},
                         Row{0xF0000, 0x10000, MemoryOwner::kDevice}, Row{0x1000000, 4, MemoryOwner::kRam},
                         Row{0x3FFE0000, 4, MemoryOwner::kNobody}, Row{0xFE000000, 4, MemoryOwner::kNobody},
                         Row{0xFEA00060, 4, MemoryOwner::kDevice}, Row{0xFED00400, 4, MemoryOwner::kNobody},
                         Row{0x1FFFFFFFF, 1, MemoryOwner::kRam}, Row{0x200000000, 1, MemoryOwner::kNobody},
                         Row{0x2000, 0, MemoryOwner::kUnknown}, Row{~0ULL, 2, MemoryOwner::kUnknown}}) {
    EXPECT_EQ(map.OwnerOf(row.first, row.length), row.owner) << std::hex << row.first;
  }
  for (const char* unknown : {"", "00000000-00000000 : Reserved\n  00000000-00000000 : System RAM\n"}) {
    EXPECT_EQ(MemoryMap(unknown).OwnerOf(0x2000, 1), MemoryOwner::kUnknown);
  }
  EXPECT_EQ(RemarkOn(MemoryOwner::kDevice, 1) + RemarkOn(MemoryOwner::kUnknown, 1), "");
  EXPECT_NE(RemarkOn(MemoryOwner::kRam, 0x2000).find("0x2000 is RAM"), std::string::npos);
  EXPECT_NE(RemarkOn(MemoryOwner::kNobody, 0xFE000000).find("0xFE000000 as far as"), std::string::npos);
}

// ---- devices by files

TEST(LinuxKeyboard, SaysOnceThatNoLedCanBeReached) {
  struct Row {
    const char* file;
    bool dangles;
    const char* told;
  };
  for (const Row& row :
       {Row{"mouse0", false, ": No keyboard of this machine has a LED for this lock key"},
        Row{"event0", false, ": No keyboard of this machine"}, Row{"event0", true, "input: No such file"}}) {
    const KernelTree tree;
    std::filesystem::create_directories(tree.At("input"));
    if (row.dangles) {
      std::filesystem::create_symlink("missing", tree.At("input") / row.file);
    } else {
      tree.Put(std::string("input/") + row.file, "");
    }
    LinuxKeyboard keyboard(tree.At("input"));
    EXPECT_EQ(ToldBy([&] {
                keyboard.Event(20, 0, Keyboard::kKeyUp);
                keyboard.Event('A', 0, 0);
              }),
              "");
    const std::string told = ToldBy([&] {
      for (const std::uint8_t key : std::array<std::uint8_t, 4>{20, 144, 145, 20}) {
        keyboard.Event(key, 0, 0);
      }
    });
    EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1) << told;
    EXPECT_NE(told.find(row.told), std::string::npos) << told;
  }
}

TEST(LinuxRawDisks, OpenNothingThatIsNoBlockDevice) {
  const KernelTree tree;
  tree.Put("file", std::string(4096, 'x'));
  LinuxRawDisks disks;
  for (const std::string& path : {tree.At("file").string(), tree.At("missing").string(), tree.At("").string(),
                                  std::string("/dev/null"), std::string()}) {
    EXPECT_EQ(ToldBy([&] { EXPECT_EQ(disks.Open(path), nullptr); }), "") << path;
  }
}

TEST(LinuxRawDisks, GiveBlocksThatUnbufferedRequestsTake) {
  LinuxRawDisks disks;
  std::vector<std::unique_ptr<DiskBlock>> blocks;
  for (const std::size_t size : {512U, 4096U, 0x8000U}) {
    blocks.push_back(disks.Allocate(size));
    ASSERT_EQ(blocks.back()->Bytes().size(), size);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(blocks.back()->Bytes().data()) % 4096, 0U);
    std::fill(blocks.back()->Bytes().begin(), blocks.back()->Bytes().end(), std::byte{1});
  }
}

TEST(LinuxCameras, FilesThatAreNoCamerasAreNotBound) {
  const KernelTree tree;
  std::filesystem::create_directories(tree.At("dev"));
  LinuxCameras cameras(tree.At("dev"));
  EXPECT_EQ(cameras.NewGraph()->OpenVideoInputs(), nullptr);
  tree.Put("dev/video", "");
  tree.Put("dev/video1x", "");
  EXPECT_EQ(cameras.NewGraph()->OpenVideoInputs(), nullptr);
  tree.Put("dev/video3", "");
  std::filesystem::create_symlink("missing", tree.At("dev/video10"));
  std::filesystem::create_symlink("missing", tree.At("dev/video9"));
  const std::string told = ToldBy([&] {
    for (int attempt = 0; attempt < 2; ++attempt) {
      const auto graph = cameras.NewGraph();
      const auto devices = graph->OpenVideoInputs();
      ASSERT_NE(devices, nullptr);
      int walked = 0;
      for (; devices->Next(); ++walked) {
        EXPECT_FALSE(devices->Bind());
      }
      EXPECT_EQ(walked, 3);
      EXPECT_LT(graph->Stop(), 0);
    }
  });
  EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 2) << told;
  EXPECT_LT(told.find("video9 "), told.find("video10 ")) << told;
}

// ---- adapters

std::string OutputOf(const char* command) {
  std::string output;
  std::FILE* const pipe = ::popen(command, "r");
  for (int c = 0; pipe != nullptr && (c = std::fgetc(pipe)) != EOF;) {
    output += static_cast<char>(c);
  }
  return pipe != nullptr && ::pclose(pipe) == 0 ? output : "";
}

constexpr int kNoNetwork = 77;

// In a network of its own, whose adapter goes down and comes back as a worker's end leaves it.
int CutAndPutBack(const KernelTree& tree, bool hasCarrier) {
  const std::string map = "0 " + std::to_string(::geteuid()) + " 1";
  if (::unshare(CLONE_NEWUSER | CLONE_NEWNET) != 0) {
    return kNoNetwork;
  }
  std::ofstream("/proc/self/uid_map") << map;
  const std::string setUp =
      "(ip link add lan0 type veth peer name lan1 && ip link set lan0 up && ip link set lan1 " +
      std::string(hasCarrier ? "up" : "down") +
      " && ip address add 192.0.2.2/24 dev lan0 && ip address add 2001:db8::2/64 dev lan0 nodad"
      " && ip route add 198.51.100.1/32 dev lan0 && ip route add default via 198.51.100.1"
      " && ip -6 route add 2001:db8:1::/48 via 2001:db8::1 && ip address add fe80::1/64 dev lan0 nodad"
      " && ip neighbour add 192.0.2.9 lladdr 02:00:00:00:00:09 dev lan0"
      " && ip link add lan2 type veth peer name lan3 && echo done) 2>/dev/null";
  if (OutputOf(setUp.c_str()) != "done\n") {
    return kNoNetwork;
  }
  constexpr const char* kShow =
      "(ip route show; ip -6 route show | grep -v fe80; ip -o -6 address show dev lan0; ip neighbour show nud "
      "permanent)"
      " | sed 's/ linkdown//; s/ tentative//; s/ valid_lft.*//' | sort";
  const std::string before = OutputOf(kShow);
  tree.Put("net/lan0/ifindex", std::to_string(::if_nametoindex("lan0")));
  tree.Put("net/lan0/flags", "0x1003");
  tree.Put("net/lan0/carrier", hasCarrier ? "1" : "0");
  tree.Put("net/lan0/device/driver", "");
  tree.Put("net/lan2/ifindex", std::to_string(::if_nametoindex("lan2")));
  tree.Put("net/lan2/flags", "0x1002");
  tree.Put("net/lan2/device/driver", "");
  LinuxConnections connections(tree.At("net"));
  const auto walk = connections.Enumerate();
  // One that is off comes first, and is off again afterwards.
  if (auto off = walk->Next(); off == nullptr || off->DeviceName() != "lan2" || !off->Connect() ||
                               OutputOf("ip -o link show lan2 up").empty() || !off->Disconnect() || !off->Connect()) {
    return 3;
  }
  if (!OutputOf("ip -o link show lan2 up").empty()) {
    return 4;
  }
  auto adapter = walk->Next();
  if (adapter == nullptr || !adapter->Disconnect() || OutputOf(kShow) == before || !adapter->Connect() ||
      !adapter->Disconnect()) {
    return 1;
  }
  adapter.reset();
  const std::string after = OutputOf(kShow);
  if (after != before) {
    std::fprintf(stderr, "before:\n%safter:\n%s", before.c_str(), after.c_str());
    return 2;
  }
  return 0;
}

TEST(LinuxConnections, TheEndOfAConnectionPutsBackRoutesAndAddresses) {
  for (const bool hasCarrier : {true, false}) {
    const KernelTree tree;
    ChildProcess child([&](int) { return CutAndPutBack(tree, hasCarrier); });
    const int result = child.Wait();
    if (result == kNoNetwork) {
      GTEST_SKIP() << "This machine lets nobody make a network of his own, or has no \"ip\".";
    }
    EXPECT_EQ(result, 0) << hasCarrier;
  }
}

}  // namespace
}  // namespace panelglow::platform::host_linux

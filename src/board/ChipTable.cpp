#include "board/ChipTable.h"

#include <algorithm>

#include "board/chips/ec/EcChip.h"
#include "board/chips/ec/EcIt8512Chip.h"
#include "board/chips/ec/EcIt8518Chip.h"
#include "board/chips/ec/EcWpc8763Chip.h"
#include "board/chips/ec/SmscKbc1126Chip.h"
#include "board/chips/ec/SmscMec1322Chip.h"
#include "board/chips/fin/FinChip.h"
#include "board/chips/fin/FinF71808aChip.h"
#include "board/chips/fin/FinF71808eChip.h"
#include "board/chips/fin/FinF71855Chip.h"
#include "board/chips/fin/FinF71858Chip.h"
#include "board/chips/fin/FinF71863Chip.h"
#include "board/chips/fin/FinF8000Chip.h"
#include "board/chips/firmware/CaslChip.h"
#include "board/chips/generic/GCodecChip.h"
#include "board/chips/generic/GEcChip.h"
#include "board/chips/generic/GEcIt8519Chip.h"
#include "board/chips/generic/GFintekChip.h"
#include "board/chips/generic/GIoSpaceChip.h"
#include "board/chips/generic/GIt8702Chip.h"
#include "board/chips/generic/GIteChip.h"
#include "board/chips/generic/GMemorySpaceChip.h"
#include "board/chips/generic/GSioChip.h"
#include "board/chips/ite/Ite8721Chip.h"
#include "board/chips/ite/Ite8758Chip.h"
#include "board/chips/ite/Ite8772Chip.h"
#include "board/chips/ite/IteChip.h"
#include "board/chips/sensor/AcpiChip.h"
#include "board/chips/sensor/AdtChip.h"
#include "board/chips/sensor/AdtSio11Chip.h"
#include "board/chips/sensor/SmbusDeviceChip.h"
#include "board/chips/sensor/VideoChip.h"
#include "board/chips/sio/SioChip.h"
#include "board/chips/sio/Smsc5407Chip.h"
#include "board/chips/sio/SmscSch5327bChip.h"
#include "board/chips/sio/Vt1211Chip.h"
#include "board/chips/southbridge/HudsonChip.h"
#include "board/chips/southbridge/IchChip.h"
#include "board/chips/southbridge/IntelC200Chip.h"
#include "board/chips/southbridge/McpChip.h"
#include "board/chips/southbridge/Sb710Chip.h"
#include "board/chips/southbridge/SbxChip.h"
#include "board/chips/win/NuvNct5571Chip.h"
#include "board/chips/win/NuvNct5572Chip.h"
#include "board/chips/win/NuvNpcd378hChip.h"
#include "board/chips/win/NuvW83667Chip.h"
#include "board/chips/win/WinChip.h"
#include "board/chips/win/WinW83202gChip.h"
#include "board/chips/win/WinWpcd376Chip.h"

namespace panelglow {

namespace {

template <class Class>
std::unique_ptr<Chip> Make() {
  return std::make_unique<Class>();
}

// A name is compared whole and with letter case.
constexpr ChipRow kRows[] = {
    {1, "chip", Make<Chip>},
    {2, "adt", Make<AdtChip>},
    {3, "adt_sio11", Make<AdtSio11Chip>},
    {4, "acpi", Make<AcpiChip>},
    {5, "casl", Make<CaslChip>},
    {6, "ec", Make<EcChip>},
    {7, "ec_wpc8763", Make<EcWpc8763Chip>},
    {8, "ec_it8512", Make<EcIt8512Chip>},
    {9, "ec_it8518", Make<EcIt8518Chip>},
    {10, "fin", Make<FinChip>},
    {11, "fin_f8000", Make<FinF8000Chip>},
    {12, "fin_f71858", Make<FinF71858Chip>},
    {13, "fin_f71855", Make<FinF71855Chip>},
    {14, "fin_f71863", Make<FinF71863Chip>},
    {15, "fin_f71808a", Make<FinF71808aChip>},
    {16, "fin_f71808e", Make<FinF71808eChip>},
    {17, "hudson", Make<HudsonChip>},
    {19, "intelc200", Make<IntelC200Chip>},
    {18, "ich", Make<IchChip>},
    {20, "ite", Make<IteChip>},
    {21, "ite_8758", Make<Ite8758Chip>},
    {22, "ite_8721", Make<Ite8721Chip>},
    {23, "ite_8772", Make<Ite8772Chip>},
    {24, "mcp", Make<McpChip>},
    {25, "nuv_w83667", Make<NuvW83667Chip>},
    {26, "nuv_nct5571", Make<NuvNct5571Chip>},
    {27, "nuv_nct5572", Make<NuvNct5572Chip>},
    {28, "sbx", Make<SbxChip>},
    {29, "sb710", Make<Sb710Chip>},
    {30, "sio", Make<SioChip>},
    {31, "smbus_device", Make<SmbusDeviceChip>},
    {32, "smsc5407", Make<Smsc5407Chip>},
    {33, "win", Make<WinChip>},
    {34, "win_w83202g", Make<WinW83202gChip>},
    {35, "win_wpcd376", Make<WinWpcd376Chip>},
    {36, "vt1211", Make<Vt1211Chip>},
    {37, "nuv_npcd378h", Make<NuvNpcd378hChip>},
    {38, "smsc_sch5327b", Make<SmscSch5327bChip>},
    {39, "g_fintek", Make<GFintekChip>},
    {39, "g_it8702", Make<GIt8702Chip>},
    {39, "g_ite", Make<GIteChip>},
    {39, "g_sio", Make<GSioChip>},
    {40, "g_ec_it8519", Make<GEcIt8519Chip>},
    {40, "g_ec", Make<GEcChip>},
    {41, "videochip", Make<VideoChip>},
    {42, "smsc_mec1322", Make<SmscMec1322Chip>},
    {43, "smsc_kbc1126", Make<SmscKbc1126Chip>},
    {44, "g_iospace", Make<GIoSpaceChip>},
    {45, "g_memoryspace", Make<GMemorySpaceChip>},
    {46, "g_codec", Make<GCodecChip>},
};

}  // namespace

std::span<const ChipRow> ChipRows() { return kRows; }

std::size_t ChipPlaceOf(std::string_view name) {
  // The plain chip has no name of its own here: it is what every other name means.
  const auto found =
      std::find_if(std::begin(kRows) + 1, std::end(kRows), [&](const ChipRow& row) { return row.name == name; });
  return found == std::end(kRows) ? kPlainChipPlace : found->place;
}

}  // namespace panelglow

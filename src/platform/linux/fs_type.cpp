#include "fs_type.h"

#include <cstdint>

#include "vano_platform.h"

namespace VANO::PLATFORM {

namespace {

// <linux/magic.h> lacks more than half of these, so all are written here.
constexpr struct {
    std::uint32_t magic;
    FsType type;
} kMagics[] = {
    {0x0000EF53, kFsExt},         {0x9123683E, kFsBtrfs},       {0x58465342, kFsXfs},
    {0x2FC12FC1, kFsZfs},         {0xF2F52010, kFsF2fs},        {0x3153464A, kFsJfs},
    {0x52654973, kFsReiserfs},    {0xCA451A4E, kFsBcachefs},    {0x01021994, kFsTmpfs},
    {0x858458F6, kFsRamfs},       {0x794C7630, kFsOverlay},     {0x65735546, kFsFuse},
    {0x00004D44, kFsVfat},        {0x2011BAB0, kFsExfat},       {0x5346544E, kFsNtfs},
    {0x7366746E, kFsNtfs3},       {0x00004244, kFsHfs},         {0x0000482B, kFsHfsplus},
    {0x00004858, kFsHfsplus},     {0x00003434, kFsNilfs},       {0x0000F15F, kFsEcryptfs},
    {0x00006969, kFsNfs},         {0xFF534D42, kFsSmb1},        {0xFE534D42, kFsSmb2},
    {0x0000517B, kFsSmbfs},       {0x00C36400, kFsCeph},        {0x01021997, kFs9p},
    {0x5346414F, kFsAfs},         {0x6B414653, kFsAfs},         {0x73757245, kFsCoda},
    {0x01161970, kFsGfs2},        {0x7461636F, kFsOcfs2},       {0x0BD00BD0, kFsLustre},
    {0x47504653, kFsGpfs},        {0x19830326, kFsBeegfs},      {0x20030528, kFsOrangefs},
    {0x786F4256, kFsVirtualHost}, {0xBACBACBC, kFsVirtualHost}, {0x00009660, kFsIso9660},
    {0x15013346, kFsUdf},         {0x73717368, kFsSquashfs},    {0xE0F5E1E2, kFsErofs},
    {0x28CD3D45, kFsCramfs},      {0x453DCD28, kFsCramfs},      {0x00007275, kFsRomfs},
};

} // namespace

FsType FsTypeFromMagic(unsigned long magic) {
    // f_type is signed on some machines: only its low 32 bits are the number.
    const auto wanted = static_cast<std::uint32_t>(magic);
    for (const auto &known : kMagics) {
        if (known.magic == wanted) {
            return known.type;
        }
    }
    return kFsUnknown;
}

} // namespace VANO::PLATFORM

int VANOFSIsRemoteFS(int type) {
    using namespace VANO::PLATFORM;
    return type >= kFsNfs && type <= kFsVirtualHost ? 1 : 0;
}

int VANOFSIsImageFS(int type) {
    using namespace VANO::PLATFORM;
    return type >= kFsLoopImage && type <= kFsRomfs ? 1 : 0;
}

#include "platform/linux/FileSystemTypes.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <utility>

namespace platform {

namespace {

constexpr std::pair<std::uint32_t, std::string_view> namesByMagic[] = {
    {0xEF53, "ext4"},         {0x9123683E, "btrfs"}, {0x58465342, "xfs"},      {0x01021994, "tmpfs"},
    {0xF2F52010, "f2fs"},     {0x4D44, "msdos"},     {0x2011BAB0, "msdos"},    {0x5346544E, "ntfs"},
    {0x7366746E, "ntfs"},     {0x6969, "nfs"},       {0xFF534D42, "cifs"},     {0xFE534D42, "smb3"},
    {0x517B, "smbfs"},        {0x15013346, "udf"},   {0x9660, "iso9660"},      {0x4244, "hfs"},
    {0x482B, "hfsplus"},      {0x4858, "hfsplus"},   {0x5346414F, "afs"},      {0x00C36400, "ceph"},
    {0x01021997, "9p"},       {0x73757245, "coda"},  {0x794C7630, "overlay"},  {0x73717368, "squashfs"},
    {0xE0F5E1E2, "erofs"},    {0x2FC12FC1, "zfs"},   {0xCA451A4E, "bcachefs"}, {0x3153464A, "jfs"},
    {0x52654973, "reiserfs"}, {0x3434, "nilfs2"},    {0xF15F, "ecryptfs"},     {0x858458F6, "ramfs"},
    {0x9FA0, "proc"},         {0x62656572, "sysfs"}, {0x65735546, "fuse"},
};

constexpr std::pair<std::string_view, std::string_view> namesByType[] = {
    {"vfat", "msdos"},    {"exfat", "msdos"},     {"exfat-fuse", "msdos"}, {"ntfs3", "ntfs"},
    {"ntfs-3g", "ntfs"},  {"lowntfs-3g", "ntfs"}, {"nfs4", "nfs"},         {"davfs", "webdav"},
    {"davfs2", "webdav"}, {"afp", "afpfs"},
};

constexpr std::array<std::string_view, 21> networkTypes = {
    "nfs",    "nfs4", "cifs",  "smb3", "smbfs",  "afs",   "9p",       "ceph",  "glusterfs", "coda",  "ncpfs",
    "lustre", "gfs2", "ocfs2", "gpfs", "beegfs", "pvfs2", "orangefs", "afpfs", "virtiofs",  "vboxsf"};

constexpr std::array<std::string_view, 15> networkFuseTypes = {"sshfs",
                                                               "davfs",
                                                               "davfs2",
                                                               "s3fs",
                                                               "rclone",
                                                               "gvfsd-fuse",
                                                               "gvfs-fuse-daemon",
                                                               "glusterfs",
                                                               "curlftpfs",
                                                               "afpfs",
                                                               "vmhgfs-fuse",
                                                               "google-drive-ocamlfuse",
                                                               "gcsfuse",
                                                               "ceph-fuse",
                                                               "portal"};

constexpr std::string_view fusePrefix = "fuse.";

template <typename List>
bool contains(const List& list, std::string_view text) {
    return std::find(std::begin(list), std::end(list), text) != std::end(list);
}

std::string_view withoutFusePrefix(std::string_view type) {
    if (type.starts_with(fusePrefix))
        type.remove_prefix(fusePrefix.size());
    return type;
}

bool isWebAddress(std::string_view device) {
    return device.starts_with("http://") || device.starts_with("https://");
}

// "user@host:/folder", "scheme://host/". A local one is a path, or the name of a program.
bool namesAnotherMachine(std::string_view device) {
    return !device.starts_with("/") && device.find(":/") != std::string_view::npos;
}

}  // namespace

std::string fileSystemNameForMagic(std::uint32_t magic) {
    for (const auto& [number, name] : namesByMagic)
        if (number == magic)
            return std::string(name);
    return fmt::format("{:#x}", magic);
}

std::string fileSystemNameForType(std::string_view type, std::string_view device) {
    if (isFuse(type) && isWebAddress(device))
        return "webdav";
    const auto program = withoutFusePrefix(type);
    for (const auto& [linuxName, name] : namesByType)
        if (linuxName == program)
            return std::string(name);
    return std::string(program);
}

bool isFuse(std::string_view type) {
    return type == "fuse" || type == "fuseblk" || type.starts_with(fusePrefix);
}

bool isNetworkFileSystem(std::string_view type, std::string_view device) {
    if (!isFuse(type))
        return contains(networkTypes, type);
    return contains(networkFuseTypes, withoutFusePrefix(type)) || namesAnotherMachine(device);
}

}  // namespace platform

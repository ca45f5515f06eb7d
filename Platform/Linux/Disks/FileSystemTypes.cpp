// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/FileSystemTypes.h>

#include <algorithm>
#include <iterator>

namespace Varnel::Platform::Linux {
namespace {

// Both tables are sorted. libmount has such tables too, but counts tmpfs and overlay as the
// kernel's own and lacks most network file systems in user space.
constexpr std::string_view pseudoTypes[] = {
    "anon_inodefs", "autofs",  "bdev",      "binfmt_misc", "bpf",        "cgroup",     "cgroup2",
    "configfs",     "cpuset",  "dax",       "debugfs",     "devpts",     "devtmpfs",   "dmabuf",
    "efivarfs",     "fusectl", "hugetlbfs", "mqueue",      "nfsd",       "nsfs",       "pidfs",
    "pipefs",       "proc",    "pstore",    "resctrl",     "rpc_pipefs", "securityfs", "selinuxfs",
    "smackfs",      "sockfs",  "spufs",     "sysfs",       "tracefs",    "xenfs"};

constexpr std::string_view networkTypes[] = {"9p",
                                             "acfs",
                                             "afs",
                                             "beegfs",
                                             "ceph",
                                             "cifs",
                                             "coda",
                                             "davfs",
                                             "fuse.ceph",
                                             "fuse.ceph-fuse",
                                             "fuse.curlftpfs",
                                             "fuse.davfs2",
                                             "fuse.gcsfuse",
                                             "fuse.glusterfs",
                                             "fuse.gvfsd-fuse",
                                             "fuse.httpfs",
                                             "fuse.juicefs",
                                             "fuse.mfs",
                                             "fuse.rclone",
                                             "fuse.s3fs",
                                             "fuse.sshfs",
                                             "fuse.webdavfs",
                                             "gfs2",
                                             "glusterfs",
                                             "gpfs",
                                             "lustre",
                                             "ncpfs",
                                             "nfs",
                                             "nfs3",
                                             "nfs4",
                                             "ocfs2",
                                             "orangefs",
                                             "pvfs2",
                                             "smb3",
                                             "smbfs"};

static_assert(std::is_sorted(std::begin(pseudoTypes), std::end(pseudoTypes)));
static_assert(std::is_sorted(std::begin(networkTypes), std::end(networkTypes)));

}  // namespace

bool isPseudoFileSystem(std::string_view type) {
  return std::binary_search(std::begin(pseudoTypes), std::end(pseudoTypes), type);
}

bool isNetworkFileSystem(std::string_view type) {
  return std::binary_search(std::begin(networkTypes), std::end(networkTypes), type);
}

}  // namespace Varnel::Platform::Linux

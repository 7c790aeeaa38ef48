// SPDX-License-Identifier: Apache-2.0
//
// The nodes: real sysfs, and the simulated driver's files.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/uio.h>
#include <unistd.h>

#include <array>
#include <cstdio>

#include "handset/kernel/tests/agreement.h"
#include "handset/kernel/tests/node_file.h"

namespace handset
{
namespace
{

const std::string kMissing = "/sys/class/leds/vibrator/missing";

std::string opens(const std::string &)
{
	std::string answers;
	for (const std::string &node :
	     {kReadWriteNode, kReadOnlyNode, kWriteOnlyNode, kOtherClass,
	      kMissing}) {
		for (const int mode : {O_RDONLY, O_WRONLY, O_RDWR})
			answers += openNode(node, mode) + " ";
		answers += "/ ";
	}
	return answers;
}

std::string opensWithFlags(const std::string &)
{
	return joined({openNode(kReadWriteNode, O_WRONLY | O_TRUNC),
		       openNode(kReadWriteNode, O_RDWR | O_CREAT),
		       openNode(kReadWriteNode, O_RDONLY | O_TRUNC),
		       openNode(kReadOnlyNode, O_RDONLY | O_TRUNC),
		       openNode(kReadWriteNode, O_RDWR | O_CREAT | O_EXCL),
		       openNode(kMissing, O_RDWR | O_CREAT),
		       openNode(kMissing, O_RDONLY | O_CREAT),
		       openNode(kReadWriteNode, O_RDONLY | O_DIRECTORY),
		       openNode("/sys/class/leds/vibrator", O_RDONLY),
		       openNode("/sys/class/leds/vibrator", O_RDWR),
		       openNode(kReadWriteNode,
				O_RDWR | O_APPEND | O_NONBLOCK | O_SYNC),
		       readNode(kReadWriteNode)});
}

std::string accesses(const std::string &)
{
	std::string answers;
	for (const std::string &node :
	     {kReadWriteNode, kReadOnlyNode, kWriteOnlyNode, kMissing}) {
		for (const int mode : {F_OK, R_OK, W_OK, X_OK, R_OK | W_OK}) {
			answers += outcome(access(node.c_str(), mode)) + " ";
		}
	}
	return answers;
}

std::string sizesOfWrites(const std::string &)
{
	const NodeFile file(kReadWriteNode, O_RDWR);
	std::string answers;
	for (const size_t size : {1U, 2U, 7U, 255U, 4094U, 4095U, 4096U}) {
		answers += file.put(std::string(size, 'x')) + " ";
		answers += std::to_string(file.getAt(5, 0).size() - 2) + " ";
	}
	return answers +
	       joined({file.put(""), file.put("9\n"), file.getAt(16, 0)});
}

std::string bytesOfWrites(const std::string &)
{
	const NodeFile file(kControlClass, O_RDWR);
	return joined({file.put(std::string("a\0b", 3)), file.getAt(9, 2),
		       file.put("\xff\xfe"), file.getAt(9, 0), file.put("\n"),
		       file.getAt(9, 0)});
}

std::string freshStores(const std::string &)
{
	const NodeFile file(kReadWriteNode, O_RDWR);
	iovec pieces[2] = {{const_cast<char *>("123"), 3},
			   {const_cast<char *>("4567"), 4}};
	const NodeFile appended(kReadWriteNode, O_WRONLY | O_APPEND);
	return joined({file.put("12345\n"), file.put("7\n"),
		       readNode(kReadWriteNode),
		       outcome(pwrite(file.fd(), "9", 1, 100)),
		       readNode(kReadWriteNode),
		       outcome(writev(file.fd(), pieces, 2)),
		       readNode(kReadWriteNode), appended.put("5"),
		       readNode(kReadWriteNode)});
}

std::string writesToNowhere(const std::string &)
{
	const char *nowhere = nullptr;
	const NodeFile file(kReadWriteNode, O_RDWR);
	const NodeFile readOnly(kReadOnlyNode, O_RDONLY);
	const NodeFile writeOnly(kWriteOnlyNode, O_WRONLY);
	return joined(
		{outcome(write(file.fd(), nowhere + 8, 4)),
		 outcome(read(file.fd(), const_cast<char *>(nowhere) + 8, 4)),
		 readOnly.put("1"), writeOnly.get(4), writeOnly.put("1"),
		 readNode(kReadWriteNode)});
}

std::string heldText(const std::string &)
{
	const NodeFile file(kHeld, O_RDWR);
	return joined(
		{file.put("COINDC\n"), file.getAt(32, 0), readNode(kHeld)});
}

std::string readsInPieces(const std::string &)
{
	writeNode(kReadWriteNode, "123456\n", O_WRONLY);
	const NodeFile file(kReadWriteNode, O_RDONLY);
	const std::string first = file.get(3);
	writeNode(kReadWriteNode, "x\n", O_WRONLY);
	return joined({first, file.get(2), file.get(9), file.get(9),
		       file.get(1), file.getAt(9, 0)});
}

std::string readsOutOfOrder(const std::string &)
{
	writeNode(kReadWriteNode, "123456\n", O_WRONLY);
	const NodeFile file(kReadWriteNode, O_RDONLY);
	std::string answers =
		joined({file.getAt(2, 3), file.getAt(9, 5), file.getAt(9, 7),
			file.getAt(9, 100), file.get(2)});
	writeNode(kReadWriteNode, "abcdef\n", O_WRONLY);
	// The piece that follows is of the text as it was; elsewhere it is the
	// text as it is.
	answers += joined({file.get(2), file.getAt(2, 2), file.getAt(2, 4)});
	writeNode(kReadWriteNode, "z\n", O_WRONLY);
	answers +=
		joined({file.getAt(2, 6), file.getAt(2, 1), file.getAt(2, 0)});
	lseek(file.fd(), 0, SEEK_SET);
	return answers + joined({file.get(16), file.get(16)});
}

std::string readsOfOneByte(const std::string &)
{
	const NodeFile file(kHeld, O_RDONLY);
	std::string answers;
	for (int i = 0; i < 14; ++i)
		answers += file.get(1);
	return answers;
}

std::string readAfterOwnWrite(const std::string &)
{
	const NodeFile file(kReadWriteNode, O_RDWR);
	return joined({file.get(1), file.put("5678\n"), file.get(9),
		       file.get(9), file.getAt(9, 0)});
}

std::string seeks(const std::string &)
{
	const NodeFile file(kReadWriteNode, O_RDWR);
	return joined({outcome(lseek(file.fd(), 0, SEEK_END)),
		       outcome(lseek(file.fd(), 5, SEEK_SET)),
		       outcome(lseek(file.fd(), 2, SEEK_CUR)),
		       outcome(lseek(file.fd(), -9, SEEK_CUR)),
		       file.put("12\n"),
		       outcome(lseek(file.fd(), 0, SEEK_CUR))});
}

std::string sizesAndSyncs(const std::string &)
{
	const NodeFile file(kReadWriteNode, O_RDWR);
	const NodeFile readOnly(kReadWriteNode, O_RDONLY);
	return joined({outcome(ftruncate(file.fd(), 0)),
		       outcome(ftruncate(file.fd(), 100)),
		       outcome(ftruncate(readOnly.fd(), 0)),
		       outcome(truncate(kReadWriteNode.c_str(), 0)),
		       outcome(truncate(kReadOnlyNode.c_str(), 0)),
		       outcome(fsync(file.fd())), readNode(kReadWriteNode)});
}

std::string attributesOf(const std::string &path)
{
	struct stat node {
	};
	const std::string answer = outcome(stat(path.c_str(), &node));
	std::array<char, 96> text{};
	snprintf(text.data(), text.size(), "%s %o %u %u %ld ", answer.c_str(),
		 node.st_mode, node.st_uid, node.st_gid,
		 static_cast<long>(node.st_size));
	return text.data();
}

std::string attributes(const std::string &)
{
	return attributesOf(kReadWriteNode) + attributesOf(kReadOnlyNode) +
	       attributesOf(kWriteOnlyNode) + attributesOf(kMissing);
}

std::string changedAttributes(const std::string &)
{
	const auto change = [](int mode) {
		return outcome(chmod(kReadWriteNode.c_str(), mode));
	};
	return joined({change(0444), openNode(kReadWriteNode, O_RDWR),
		       change(0220), openNode(kReadWriteNode, O_RDONLY),
		       change(0), openNode(kReadWriteNode, O_WRONLY),
		       change(0666), openNode(kReadWriteNode, O_RDWR),
		       outcome(chown(kReadWriteNode.c_str(), 2000, 2000)),
		       attributesOf(kReadWriteNode)});
}

// The bits alone say who may open; without the method in the driver the access
// itself fails.
std::string bitsWithoutMethods(const std::string &)
{
	std::string answers =
		joined({outcome(chmod(kReadOnlyNode.c_str(), 0666)),
			outcome(chmod(kWriteOnlyNode.c_str(), 0666))});
	const NodeFile readOnly(kReadOnlyNode, O_RDWR);
	const NodeFile writeOnly(kWriteOnlyNode, O_RDWR);
	return answers + joined({readOnly.put("1"), readOnly.put(""),
				 readOnly.getAt(9, 0), writeOnly.get(9),
				 writeOnly.put("1"), writeOnly.get(9)});
}

std::string changedDirectories(const std::string &)
{
	const std::string directory = "/sys/class/leds/vibrator/new";
	return joined(
		{outcome(unlink(kReadWriteNode.c_str())),
		 outcome(unlink(kMissing.c_str())),
		 outcome(mkdir(directory.c_str(), 0755)),
		 outcome(rmdir(directory.c_str())),
		 outcome(rename(kReadWriteNode.c_str(), kMissing.c_str())),
		 outcome(symlink("duration", kMissing.c_str())),
		 outcome(link(kReadWriteNode.c_str(), kMissing.c_str())),
		 outcome(mknod(kMissing.c_str(), S_IFREG | 0644, 0)),
		 outcome(mknod(kMissing.c_str(), S_IFIFO | 0644, 0))});
}

const Agreement kSysfsCases[] = {
	{"RootOpensWhatHasTheMethod", kRoot, opens,
	 "ok ok ok / ok EACCES EACCES / EACCES ok EACCES / ok ok ok / ENOENT "
	 "ENOENT ENOENT / "},
	{"TheSystemUserOpensItsNodes", kSystem, opens,
	 "ok ok ok / ok EACCES EACCES / EACCES ok EACCES / ok ok ok / ENOENT "
	 "ENOENT ENOENT / "},
	{"AStrangerOnlyReads", kStranger, opens,
	 "ok EACCES EACCES / ok EACCES EACCES / EACCES EACCES EACCES / ok "
	 "EACCES EACCES / "
	 "ENOENT ENOENT ENOENT / "},
	{"FlagsOfAnOpenByRoot", kRoot, opensWithFlags,
	 "ok ok ok ok EEXIST EACCES EACCES ENOTDIR ok EISDIR ok 0\n "},
	{"FlagsOfAnOpenByTheSystemUser", kSystem, opensWithFlags,
	 "ok ok ok EACCES EEXIST EACCES EACCES ENOTDIR ok EISDIR ok 0\n "},
	{"AccessOfRoot", kRoot, accesses,
	 "0 0 0 EACCES 0 0 0 0 EACCES 0 0 0 0 EACCES 0 ENOENT ENOENT ENOENT "
	 "ENOENT ENOENT "},
	{"AccessOfTheSystemUser", kSystem, accesses,
	 "0 0 0 EACCES 0 0 0 EACCES EACCES EACCES 0 EACCES 0 EACCES EACCES "
	 "ENOENT ENOENT ENOENT "
	 "ENOENT ENOENT "},
	{"AccessOfAStranger", kStranger, accesses,
	 "0 0 EACCES EACCES EACCES 0 0 EACCES EACCES EACCES 0 EACCES EACCES "
	 "EACCES EACCES ENOENT "
	 "ENOENT ENOENT ENOENT ENOENT "},
	{"WritesOfUpToAPageArriveWhole", kSystem, sizesOfWrites,
	 "1 1 2 2 7 5 255 5 4094 5 4095 5 4096 5 0 2 [9\n] "},
	{"BytesArriveAsTheyAre", kSystem, bytesOfWrites,
	 "3 [b] 2 [\xff\xfe] 1 [\n] "},
	{"EveryWriteIsAFreshStore", kSystem, freshStores,
	 "6 2 7\n 1 9 7 1234567 1 5 "},
	{"FailedCallsChangeNothing", kSystem, writesToNowhere,
	 "EFAULT EFAULT EBADF EBADF 1 0\n "},
	{"AHeldTextStays", kSystem, heldText,
	 "7 [LINEAR_1040\n] LINEAR_1040\n "},
	{"AReadInPiecesGoesThroughOneShowing", kSystem, readsInPieces,
	 "[123] [45] [6\n] [] [] [x\n] "},
	{"AReadElsewhereShowsAnew", kSystem, readsOutOfOrder,
	 "[45] [6\n] [] [] [12] [34] [cd] [ef] [\n] [\n] [z\n] [z\n] [] "},
	{"AReadByteByByte", kSystem, readsOfOneByte,
	 "[L][I][N][E][A][R][_][1][0][4][0][\n][][]"},
	{"AWriteMovesTheReadingPlaceToo", kSystem, readAfterOwnWrite,
	 "[0] 5 [] [] [5678\n] "},
	{"SeekingGoesByASizeOfOnePage", kSystem, seeks,
	 "4096 5 7 EINVAL 3 10 "},
	{"SizesCannotBeChanged", kRoot, sizesAndSyncs, "0 0 EINVAL 0 0 0 0\n "},
	{"SizesCannotBeChangedByTheSystemUser", kSystem, sizesAndSyncs,
	 "0 0 EINVAL 0 EACCES 0 0\n "},
	{"AttributesAreThoseOfSysfs", kStranger, attributes,
	 "0 100664 1000 1000 4096 0 100444 1000 1000 4096 0 100220 1000 1000 "
	 "4096 "
	 "ENOENT 0 0 0 0 "},
	{"RootChangesAttributes", kRoot, changedAttributes,
	 "0 EACCES 0 EACCES 0 EACCES 0 ok 0 0 100666 2000 2000 4096  "},
	{"TheOwnerChangesAttributes", kSystem, changedAttributes,
	 "0 EACCES 0 EACCES 0 EACCES 0 ok EPERM 0 100666 1000 1000 4096  "},
	{"AStrangerChangesNothing", kStranger, changedAttributes,
	 "EPERM EACCES EPERM ok EPERM EACCES EPERM EACCES EPERM 0 100664 1000 "
	 "1000 4096  "},
	{"PermissionBitsMakeNoMethods", kRoot, bitsWithoutMethods,
	 "0 0 EIO 0 [137\n] EIO 1 EIO "},
	{"RootCreatesAndRemovesNothing", kRoot, changedDirectories,
	 "EPERM ENOENT EPERM ENOENT EPERM EPERM EPERM EACCES EPERM "},
	{"TheSystemUserCreatesAndRemovesNothing", kSystem, changedDirectories,
	 "EACCES ENOENT EACCES ENOENT EACCES EACCES EACCES EACCES EACCES "},
	{"AStrangerCreatesAndRemovesNothing", kStranger, changedDirectories,
	 "EACCES ENOENT EACCES ENOENT EACCES EACCES EPERM EACCES EACCES "},
};

class SysfsAgreement : public testing::TestWithParam<Agreement>
{
};

TEST_P(SysfsAgreement, OfRealAndSimulated)
{
	expectAgreement(GetParam());
}

INSTANTIATE_TEST_SUITE_P(Sysfs, SysfsAgreement, testing::ValuesIn(kSysfsCases),
			 nameOf<Agreement>);

} // namespace
} // namespace handset

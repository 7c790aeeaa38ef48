// SPDX-License-Identifier: Apache-2.0
//
// A node as a client has it open.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <string>

#include "handset/kernel/tests/drivers.h"

namespace handset
{

class NodeFile
{
      public:
	NodeFile(const std::string &path, int flags)
	    : mFd(open(path.c_str(), flags | O_CLOEXEC))
	{
	}
	~NodeFile()
	{
		if (mFd >= 0)
			close(mFd);
	}
	NodeFile(const NodeFile &) = delete;
	NodeFile &operator=(const NodeFile &) = delete;

	int fd() const
	{
		return mFd;
	}

	// One write: its result.
	std::string put(const std::string &text) const
	{
		return outcome(write(mFd, text.data(), text.size()));
	}

	// One read: the text in brackets, or the error.
	std::string get(size_t size) const
	{
		return shown(size, -1);
	}
	std::string getAt(size_t size, off_t offset) const
	{
		return shown(size, offset);
	}

      private:
	std::string shown(size_t size, off_t offset) const
	{
		std::string text(size, '\0');
		const ssize_t got =
			offset < 0 ? read(mFd, text.data(), size)
				   : pread(mFd, text.data(), size, offset);
		return got < 0 ? outcome(got)
			       : "[" +
					 text.substr(0,
						     static_cast<size_t>(got)) +
					 "]";
	}

	int mFd;
};

} // namespace handset

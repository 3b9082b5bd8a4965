#include "SafeFile.h"

#if ! JUCE_WINDOWS
 #include <cerrno>
 #include <fcntl.h>
 #include <unistd.h>
#endif

namespace veltrane
{

namespace
{
    juce::File temporarySibling (const juce::File& target)
    {
        juce::Random random;   // seeded from the clock and a counter, different per call
        return target.getSiblingFile (".veltrane-" + juce::String::toHexString (random.nextInt64()) + ".tmp");
    }

   #if ! JUCE_WINDOWS
    bool writeWhole (int descriptor, const char* data, size_t numBytes)
    {
        while (numBytes > 0)
        {
            const auto written = ::write (descriptor, data, numBytes);

            if (written < 0 && errno == EINTR)
                continue;

            if (written <= 0)
                return false;

            data += written;
            numBytes -= (size_t) written;
        }

        return true;
    }

    // A new file holding exactly the bytes, on the disk; false when it could not be
    // created (it exists already: another name is drawn) or not written whole.
    bool writeNewFile (const juce::File& file, const void* data, size_t numBytes, bool& nameTaken)
    {
        const auto path = file.getFullPathName();
        const auto descriptor = ::open (path.toRawUTF8(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        nameTaken = descriptor < 0 && errno == EEXIST;

        if (descriptor < 0)
            return false;

        auto written = writeWhole (descriptor, static_cast<const char*> (data), numBytes) && ::fsync (descriptor) == 0;
        written = ::close (descriptor) == 0 && written;

        if (! written)
            ::unlink (path.toRawUTF8());

        return written;
    }

    // The rename itself reaches the disk with the folder's entry.
    void syncFolder (const juce::File& folder)
    {
        const auto descriptor = ::open (folder.getFullPathName().toRawUTF8(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);

        if (descriptor >= 0)
        {
            ::fsync (descriptor);
            ::close (descriptor);
        }
    }
   #else
    bool writeNewFile (const juce::File& file, const void* data, size_t numBytes, bool& nameTaken)
    {
        nameTaken = file.exists();

        if (nameTaken)
            return false;

        auto written = false;
        {
            // Unbuffered, so the one write reports how much of it reached the file.
            juce::FileOutputStream out (file, 0);
            written = out.openedOk() && out.write (data, numBytes);
            out.flush();
            written = written && out.getStatus().wasOk();
        }

        written = written && file.getSize() == (juce::int64) numBytes;

        if (! written)
            file.deleteFile();

        return written;
    }
   #endif
}

bool replaceFileContents (const juce::File& target, const void* data, size_t numBytes)
{
    for (int attempt = 0; attempt < 8; ++attempt)
    {
        const auto temporary = temporarySibling (target);
        bool nameTaken = false;

        if (writeNewFile (temporary, data, numBytes, nameTaken))
        {
           #if JUCE_WINDOWS
            if (temporary.replaceFileIn (target))
                return true;
           #else
            if (::rename (temporary.getFullPathName().toRawUTF8(), target.getFullPathName().toRawUTF8()) == 0)
            {
                syncFolder (target.getParentDirectory());
                return true;
            }
           #endif

            temporary.deleteFile();
            return false;
        }

        if (! nameTaken)
            return false;
    }

    return false;
}

} // namespace veltrane

#include "Core/BaseLib/ThreadCount.h"

#include <dirent.h>

int runningThreads()
{
    // One entry per thread (proc(5)); a stat of the folder would not do, its link count is not kept up
    // everywhere.
    DIR *tasks = opendir("/proc/self/task");
    if (!tasks)
        return 0;
    int count = 0;
    while (const dirent *entry = readdir(tasks))
        if (entry->d_name[0] != '.')
            ++count;
    closedir(tasks);
    return count;
}

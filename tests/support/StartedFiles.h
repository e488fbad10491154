// The library as far as files and resource files need it, with a scratch drive T:. Leaks are failures.
#pragma once

#include "files/Service.h"
#include "resources/Service.h"
#include "support/ScratchDrive.h"
#include "support/StartedPaths.h"
#include <tessel/paths/PathRef.h>

namespace tessel::test {

class StartedFiles : public StartedPaths {
public:
    StartedFiles() {
        EXPECT_EQ(kNoErr, FileManagerStart());
        EXPECT_EQ(kNoErr, ResourceManagerStart());
    }
    ~StartedFiles() {
        ResourceManagerStop();
        FileManagerStop();
    }

    // Something on the scratch drive, "sub/file".
    PathRef On(std::string_view inside) const { return PathRef(drive.Name(inside), PathRef::StringDisplay()); }

    // The same for one call: the path lasts as long as the expression.
    struct Lasting {
        PathRef path;
        operator Path() { return &path; }
    };
    Lasting At(std::string_view inside) const { return {On(inside)}; }

    ScratchDrive drive;
};

}  // namespace tessel::test


// A project outside the tree: flat functions and a class of the library, from the installed headers alone.
#include <tessel/tessel.h>

#include <cstdio>
#include <string>

int main() {
    if (InitTesselBase() != kNoErr || InitTesselAppSupport() != kNoErr) return 1;
    std::string text;
    MgErr err = kNoErr;
    {
        tessel::PathRef path(tessel::PathRef::kAbsolute);
        path.Append("C");
        path.Append("dir");
        path.Append("file");
        err = path.ConvertToString(&text, tessel::PathRef::StringDisplay());
    }
    std::printf("%s\n", text.c_str());
    UninitTesselAppSupport();
    UninitTesselBase();
    return err;
}

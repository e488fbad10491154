#include <tessel/base/MgErr.h>

const char* MgErrMeaning(MgErr err) {
    switch (err) {
#define TESSEL_MGERR_MEANING(name, code, meaning) \
    case code:                                    \
        return meaning;
        TESSEL_MGERR_LIST(TESSEL_MGERR_MEANING)
#undef TESSEL_MGERR_MEANING
        default:
            return "unknown error";
    }
}

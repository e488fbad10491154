// The application interface: an object of the host's that tells the library what application it runs in.
#ifndef TESSEL_BASE_MGAPPINTERFACE_H
#define TESSEL_BASE_MGAPPINTERFACE_H

#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {

// The host derives from it and overrides what applies. The slots and their order are fixed; those without a name are
// not called.
class TESSEL_API MGAppInterface {
public:
    virtual uintptr_t Slot0() { return 0; }
    virtual CStr ApplicationName() { return ""; }     ///< for the configuration
    virtual CStr ApplicationAltName() { return ""; }  ///< for the configuration, of the other edition
    virtual uint32 AppAPIVersion() { return 0; }      // version of this interface
    virtual uint32 AppEditorVersion() { return 0; }
    virtual uintptr_t Slot5() { return 0; }
    virtual uintptr_t Slot6() { return 0; }
    virtual uintptr_t Slot7() { return 0; }
    virtual uintptr_t Slot8() { return 0; }
    virtual CStr PreferenceBaseName() { return ""; }  ///< of the preference file, without ".ini"
    virtual uintptr_t Slot10() { return 0; }
    virtual int32 IsTopLevel() { return 0; }  // not 0: true
    virtual int32 IsBoundApp() { return 0; }  // a built application
    virtual int32 IsRunTime() { return 0; }   // a run-time engine
    virtual int32 IsFullFeatureRunTime() { return 0; }
    virtual uintptr_t Slot15() { return 0; }
    virtual uintptr_t Slot16() { return 0; }
    virtual uintptr_t Slot17() { return 0; }
    virtual uintptr_t Slot18() { return 0; }
    virtual uintptr_t Slot19() { return 0; }
    virtual uintptr_t Slot20() { return 0; }
    virtual uintptr_t Slot21() { return 0; }
    virtual uintptr_t Slot22() { return 0; }
    virtual RsrcFile AppResourceFile() { return 0; }  // the application's resource file; 0: none
    virtual ~MGAppInterface() = default;
};

}  // namespace tessel
typedef tessel::MGAppInterface* MGAppInterfacePtr;
#else
typedef struct tessel_MGAppInterface* MGAppInterfacePtr;
#endif

TESSEL_BEGIN_C

// Installs the object, which stays the host's; null takes it away. At start, before other threads ask.
TESSEL_API void MGAppInterfaceSet(MGAppInterfacePtr app);

// The object installed; null when there is none. Any thread.
TESSEL_API MGAppInterfacePtr MGApp(void);

// What the object, or for null the installed one, answers; 0 without any.
TESSEL_API uint32 MGGetAppAPIVersion(MGAppInterfacePtr app);
TESSEL_API uint32 MGGetAppEditorVersion(MGAppInterfacePtr app);
TESSEL_API int32 MGGetIsTopLevel(MGAppInterfacePtr app);
TESSEL_API int32 MGGetIsBoundApp(MGAppInterfacePtr app);
TESSEL_API int32 MGGetIsRunTime(MGAppInterfacePtr app);
TESSEL_API int32 MGGetIsFullFeatureRunTime(MGAppInterfacePtr app);

TESSEL_END_C

#endif

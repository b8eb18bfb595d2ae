/* A ReWire library that is none: it exports the functions of the mixer interface, all but those that it is
 * built without. */

#ifndef OPEN_RESULT
#define OPEN_RESULT 1
#endif

#define ENTRY(name)                                                                                          \
    __declspec(dllexport) int name(void);                                                                    \
    int name(void) { return 0; }

/* Notes the version that it was asked for at the caller's address. */
__declspec(dllexport) int RWM2OpenImp(int version, int *seen);
int RWM2OpenImp(int version, int *seen)
{
    *seen = version;
    return OPEN_RESULT;
}

ENTRY(RWM2IsCloseOKImp)
ENTRY(RWM2CloseImp)
ENTRY(RWM2GetDeviceCountImp)
ENTRY(RWM2GetDeviceInfoImp)
ENTRY(RWM2GetDeviceInfoByHandleImp)
ENTRY(RWM2OpenDeviceImp)
ENTRY(RWM2IsCloseDeviceOKImp)
ENTRY(RWM2CloseDeviceImp)
ENTRY(RWM2DriveAudioImp)
ENTRY(RWM2LaunchPanelAppImp)
ENTRY(RWM2IsPanelAppLaunchedImp)
ENTRY(RWM2QuitPanelAppImp)
ENTRY(RWM2GetEventInfoImp)
ENTRY(RWM2GetEventBusInfoImp)
ENTRY(RWM2GetEventChannelInfoImp)
ENTRY(RWM2GetControllerInfoImp)
ENTRY(RWM2GetNoteInfoImp)
#ifndef WITHOUT_AN_ENTRY
ENTRY(RWM2SetAudioInfoImp)
#endif

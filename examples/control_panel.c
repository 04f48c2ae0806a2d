/* A control panel with one slider: opens an endpoint by its index, reads the bass of its effects, sets it, and reads it back. */
#include <VXAPOCOMAPI.h>

#include <stdio.h>
#include <stdlib.h>

static int failed(const char *what, VXAPOHandle panel) {
    const int32_t code = VXAPOCOMAPI_GetLastError(panel);
    fprintf(stderr, "%s: error %d", what, (int)code);
    if (code == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE)
        fprintf(stderr, ", of the system %u", (unsigned)VXAPOCOMAPI_GetWindowsLastError(panel));
    fputs("\n", stderr);
    if (panel != NULL) VXAPOCOMAPI_Free(panel);
    return 3;
}

int main(int argc, char **argv) {
    const int index = argc > 1 ? atoi(argv[1]) : 0;
    const float wanted = argc > 2 ? (float)atof(argv[2]) : 0.7f; /* 0.0 to 1.0 */

    VXAPOHandle panel = VXAPOCOMAPI_Initialize(index);
    if (panel == NULL) return failed("no such endpoint", NULL);
    if (!VXAPOCOMAPI_SetAPOType(panel, "EFX")) return failed("no such slot", panel);

    const float before = VXAPOCOMAPI_GetUserParameter(panel, USER_PARAM_ID_BASS_LEVEL);
    if (before < 0) return failed("the bass cannot be read", panel);
    if (!VXAPOCOMAPI_SetUserParameter(panel, USER_PARAM_ID_BASS_LEVEL, wanted)) return failed("the bass cannot be set", panel);
    const float after = VXAPOCOMAPI_GetUserParameter(panel, USER_PARAM_ID_BASS_LEVEL);
    printf("bass %.3f -> %.3f\n", (double)before, (double)after);
    return VXAPOCOMAPI_Free(panel) ? 0 : 1;
}

#include "notes/sametime_config.h"

// Filled in with the platform.xml work.
int UpdateSametime8Config(bool, int) {
    return 0;
}
int UpdateSametime7Config(bool) {
    return 0;
}
int UpdateEmbeddedST8Config(bool) {
    return 0;
}
int IsSametime8ConfigEnable(int) {
    return 0;
}
int isembedST8enable() {
    return 0;
}

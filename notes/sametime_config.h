// Enabling, disabling and testing the meeting feature in the Eclipse
// platform.xml of Sametime 8 (two profiles), Sametime 7 and the embedded
// Sametime. Results: 1 processed (or listed), 0 failed (or not listed).
#pragma once

int UpdateSametime8Config(bool enable, int profile);
int UpdateSametime7Config(bool enable);
int UpdateEmbeddedST8Config(bool enable);
int IsSametime8ConfigEnable(int profile);
int isembedST8enable();

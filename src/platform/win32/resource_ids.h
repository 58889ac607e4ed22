// Resource identifiers shared by the resource script and the code.
#pragma once

#define IDI_PADLOCK 101
#define IDI_BULB_DARK 102
#define IDI_BULB_LIT 103

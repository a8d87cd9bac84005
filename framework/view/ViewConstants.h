#pragma once

#include <cstdint>

namespace Tarsa {

// The option word of a view, as layout files write it.
inline constexpr std::uint32_t kView_NoOptions = 0;
inline constexpr std::uint32_t kView_Invisible = 1;
inline constexpr std::uint32_t kView_Disabled = 2;
inline constexpr std::uint32_t kView_Target = 4;
inline constexpr std::uint32_t kView_Bullseye = 8;
inline constexpr std::uint32_t kView_TabStop = 16;
inline constexpr std::uint32_t kView_TargetRing = 32;
inline constexpr std::uint32_t kView_ContextClick = 64;
inline constexpr std::uint32_t kView_InvalidOnActivate = 128;
inline constexpr std::uint32_t kView_DrawBuffer = 256;
inline constexpr std::uint32_t kView_DrawParts = 512;
inline constexpr std::uint32_t kView_ChunkyScroll = 1024;
inline constexpr std::uint32_t kView_EntireScroll = 2048;
inline constexpr std::uint32_t kView_BigCoordinates = 4096;
inline constexpr std::uint32_t kView_IgnoreMouseEvents = 8192;
inline constexpr std::uint32_t kView_MultiOnMouseUp = 16384;
inline constexpr std::uint32_t kView_NoFocusOnClick = 32768;
inline constexpr std::uint32_t kView_NoTabNavigate = 65536;
inline constexpr std::uint32_t kView_SupressSurrenders = 131072;

// The bits of a view's viewFlags word.
inline constexpr std::uint32_t kViewFlag_Visible = 0x1;
inline constexpr std::uint32_t kViewFlag_Enabled = 0x4;
inline constexpr std::uint32_t kViewFlag_Started = 0x10;
inline constexpr std::uint32_t kViewFlag_Target = 0x80;
inline constexpr std::uint32_t kViewFlag_Bullseye = 0x100;
inline constexpr std::uint32_t kViewFlag_TabStop = 0x200;
inline constexpr std::uint32_t kViewFlag_TargetRing = 0x400;
inline constexpr std::uint32_t kViewFlag_InvalidOnActivate = 0x800;
inline constexpr std::uint32_t kViewFlag_DrawBuffer = 0x1000;
inline constexpr std::uint32_t kViewFlag_DrawParts = 0x2000;
inline constexpr std::uint32_t kViewFlag_ChunkyScroll = 0x4000;
inline constexpr std::uint32_t kViewFlag_EntireScroll = 0x8000;
inline constexpr std::uint32_t kViewFlag_BigCoordinates = 0x10000;
inline constexpr std::uint32_t kViewFlag_ContextClick = 0x20000;
inline constexpr std::uint32_t kViewFlag_IgnoreMouse = 0x40000;
inline constexpr std::uint32_t kViewFlag_MultiOnMouseUp = 0x80000;
inline constexpr std::uint32_t kViewFlag_NoFocusOnClick = 0x100000;
inline constexpr std::uint32_t kViewFlag_NoTabNavigate = 0x200000;
inline constexpr std::uint32_t kViewFlag_SupressSurrenders = 0x400000;

// The viewFlags word an option word gives: visible and enabled unless the
// options say otherwise, and each option's own bits.
std::uint32_t ViewFlagsOf(std::uint32_t options);

// How a view follows its parent's size, and how its image scrolls.
inline constexpr std::uint32_t kBind_XSizeable = 1;
inline constexpr std::uint32_t kBind_YSizeable = 2;
inline constexpr std::uint32_t kBind_XCenter = 4;
inline constexpr std::uint32_t kBind_YCenter = 8;
inline constexpr std::uint32_t kBind_Left = 16;
inline constexpr std::uint32_t kBind_Top = 32;
inline constexpr std::uint32_t kBind_Right = 64;
inline constexpr std::uint32_t kBind_Bottom = 128;
inline constexpr std::uint32_t kBind_XScrollable = 256;
inline constexpr std::uint32_t kBind_YScrollable = 512;
inline constexpr std::uint32_t kBind_PinLeft = 1024;
inline constexpr std::uint32_t kBind_PinTop = 2048;
inline constexpr std::uint32_t kBind_PinRight = 4096;
inline constexpr std::uint32_t kBind_PinBottom = 8192;
inline constexpr std::uint32_t kBind_LimitLeft = 16384;
inline constexpr std::uint32_t kBind_LimitTop = 32768;
inline constexpr std::uint32_t kBind_LimitRight = 65536;
inline constexpr std::uint32_t kBind_LimitBottom = 131072;
inline constexpr std::uint32_t kBind_PortCoordinates = 262144;

// The combined names.
inline constexpr std::uint32_t kBind_Fixed = 0;
inline constexpr std::uint32_t kBind_FixedLeft = kBind_Left;
inline constexpr std::uint32_t kBind_FixedMidX = kBind_XCenter;
inline constexpr std::uint32_t kBind_FixedRight = kBind_Right;
inline constexpr std::uint32_t kBind_FixedTop = kBind_Top;
inline constexpr std::uint32_t kBind_FixedMidY = kBind_YCenter;
inline constexpr std::uint32_t kBind_FixedBottom = kBind_Bottom;
inline constexpr std::uint32_t kBind_FixedCenterLeft = kBind_Left | kBind_XCenter;
inline constexpr std::uint32_t kBind_FixedCenterTop = kBind_Top | kBind_YCenter;
inline constexpr std::uint32_t kBind_FixedCenterRight = kBind_Right | kBind_XCenter;
inline constexpr std::uint32_t kBind_FixedCenterBottom = kBind_Bottom | kBind_YCenter;
inline constexpr std::uint32_t kBind_SizeLeft = kBind_XSizeable | kBind_Left;
inline constexpr std::uint32_t kBind_SizeMidX = kBind_XSizeable | kBind_XCenter;
inline constexpr std::uint32_t kBind_SizeRight = kBind_XSizeable | kBind_Right;
inline constexpr std::uint32_t kBind_SizeTop = kBind_YSizeable | kBind_Top;
inline constexpr std::uint32_t kBind_SizeMidY = kBind_YSizeable | kBind_YCenter;
inline constexpr std::uint32_t kBind_SizeBottom = kBind_YSizeable | kBind_Bottom;
inline constexpr std::uint32_t kBind_SizeCenterLeft = kBind_SizeLeft | kBind_XCenter;
inline constexpr std::uint32_t kBind_SizeCenterTop = kBind_SizeTop | kBind_YCenter;
inline constexpr std::uint32_t kBind_SizeCenterRight = kBind_SizeRight | kBind_XCenter;
inline constexpr std::uint32_t kBind_SizeCenterBottom = kBind_SizeBottom | kBind_YCenter;
inline constexpr std::uint32_t kBind_Sizeable = kBind_XSizeable | kBind_YSizeable;
inline constexpr std::uint32_t kBind_FixedTopLeft = kBind_Top | kBind_Left;
inline constexpr std::uint32_t kBind_FixedTopMiddle = kBind_Top | kBind_XCenter;
inline constexpr std::uint32_t kBind_FixedTopRight = kBind_Top | kBind_Right;
inline constexpr std::uint32_t kBind_FixedMiddleLeft = kBind_YCenter | kBind_Left;
inline constexpr std::uint32_t kBind_FixedMiddle = kBind_XCenter | kBind_YCenter;
inline constexpr std::uint32_t kBind_FixedMiddleRight = kBind_YCenter | kBind_Right;
inline constexpr std::uint32_t kBind_FixedBottomLeft = kBind_Bottom | kBind_Left;
inline constexpr std::uint32_t kBind_FixedBottomMiddle = kBind_Bottom | kBind_XCenter;
inline constexpr std::uint32_t kBind_FixedBottomRight = kBind_Bottom | kBind_Right;
inline constexpr std::uint32_t kBind_XNoPin = kBind_PinLeft | kBind_PinRight;
inline constexpr std::uint32_t kBind_YNoPin = kBind_PinTop | kBind_PinBottom;
inline constexpr std::uint32_t kBind_Scrollable = kBind_XScrollable | kBind_YScrollable;
inline constexpr std::uint32_t kBind_PinTopLeft = kBind_PinTop | kBind_PinLeft;
inline constexpr std::uint32_t kBind_PinTopRight = kBind_PinTop | kBind_PinRight;
inline constexpr std::uint32_t kBind_PinBottomLeft = kBind_PinBottom | kBind_PinLeft;
inline constexpr std::uint32_t kBind_PinBottomRight = kBind_PinBottom | kBind_PinRight;
inline constexpr std::uint32_t kBind_NoPin = kBind_XNoPin | kBind_YNoPin;
inline constexpr std::uint32_t kBind_LimitTopLeft = kBind_LimitTop | kBind_LimitLeft;
inline constexpr std::uint32_t kBind_LimitTopMiddle = kBind_LimitTop;
inline constexpr std::uint32_t kBind_LimitTopRight = kBind_LimitTop | kBind_LimitRight;
inline constexpr std::uint32_t kBind_LimitMiddleLeft = kBind_LimitLeft;
inline constexpr std::uint32_t kBind_LimitMiddle = 0;
inline constexpr std::uint32_t kBind_LimitMiddleRight = kBind_LimitRight;
inline constexpr std::uint32_t kBind_LimitBottomLeft = kBind_LimitBottom | kBind_LimitLeft;
inline constexpr std::uint32_t kBind_LimitBottomMiddle = kBind_LimitBottom;
inline constexpr std::uint32_t kBind_LimitBottomRight = kBind_LimitBottom | kBind_LimitRight;
inline constexpr std::uint32_t kBind_ScrollTopLeft = kBind_Scrollable | kBind_PinTopLeft;
inline constexpr std::uint32_t kBind_ScrollTopRight = kBind_Scrollable | kBind_PinTopRight;
inline constexpr std::uint32_t kBind_ScrollBottomLeft = kBind_Scrollable | kBind_PinBottomLeft;
inline constexpr std::uint32_t kBind_ScrollBottomRight = kBind_Scrollable | kBind_PinBottomRight;

// A scroller's parts, and the places in a scroller a child can ask for
// (frame_interior), as layout files write them.
inline constexpr std::uint32_t kScroller_NoControls = 0;
inline constexpr std::uint32_t kScroller_XBar = 1;
inline constexpr std::uint32_t kScroller_YBar = 2;
inline constexpr std::uint32_t kScroller_SizeBox = 4;
inline constexpr std::uint32_t kScroller_WellFrame = 8;
inline constexpr std::uint32_t kScroller_AutoHideScrollBars = 16;
inline constexpr std::uint32_t kScroller_AllControls = 7;
inline constexpr std::int32_t kInterior_ScrollerPane = 100;
inline constexpr std::int32_t kInterior_ScrollerGapLeft = 101;
inline constexpr std::int32_t kInterior_ScrollerGapTop = 102;
inline constexpr std::int32_t kInterior_ScrollerGapRight = 103;
inline constexpr std::int32_t kInterior_ScrollerGapBottom = 104;
// The width a zoom combo is given.
inline constexpr std::int32_t kZoomCombo_DefaultWidth = 110;

}  // namespace Tarsa

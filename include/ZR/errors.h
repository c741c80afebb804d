// Reported error numbers: 0x25 in the high half, the number of the reporting place in the low half.
#pragma once

#include <ZR/zr.h>

inline constexpr u32 ZR_ModuleCode = 0x25u << 16;
inline constexpr i32 ZR_ReportSeverity = 8;

// One number for each place that reports (8 serves two).
enum ZR_CallSite : u32 {
  ZR_Site_Plain = 0x00,
  ZR_Site_GetCallbackAddr = 0x01,
  ZR_Site_DisposeEffectWorld = 0x03,
  ZR_Site_UnimplementedMode = 0x06,
  ZR_Site_ChannelOrder = 0x08,
  ZR_Site_Convolve = 0x08,
  ZR_Site_GaussianKernel = 0x0a,
  ZR_Site_Fill = 13,
  ZR_Site_Iterate = 14,
  ZR_Site_BatchSampling = 0x2e,
  ZR_Site_OverrideStdFuncs = 0x2f,
  ZR_Site_CopyBitsDraft = 48,
  ZR_Site_CopyBitsStraight = 49,
  ZR_Site_CopyBitsPremul = 50,
  ZR_Site_PlatformQuery = 0x38,
  ZR_Site_Scratch = 0x47,
  ZR_Site_Chunk = 0x4a,
  ZR_Site_IterateGeneric = 70,
  ZR_Site_ChannelCopy = 72,
  ZR_Site_IterateOrigin = 82,
  ZR_Site_MatrixCopy = 101,
  ZR_Site_WorldSize = 0x66,
  ZR_Site_CopyRectDepth = 0x6e,
  ZR_Site_CopyRect = 0x6f,
  ZR_Site_ShrinkToSubRect = 0x70,
  ZR_Site_ReReference = 0x71,
  ZR_Site_NewReference = 0x72,
  ZR_Site_RSWorldDepth = 0x73,
  ZR_Site_GetPixelData = 0x74,
  ZR_Site_IterateDepth = 0x75,
  ZR_Site_BlendDescriptor = 0x76,
  ZR_Site_LinearTables = 0x77,
  ZR_Site_TransferRect = 0x78,
  ZR_Site_ClearAlpha = 0x79,
  ZR_Site_Blend = 0x7a,
  ZR_Site_BlendData = 0x7b,
  ZR_Site_CompositeRect = 0x7c,
  ZR_Site_Premul = 0x7d,
  ZR_Site_ScratchDepth = 0x7e,
  ZR_Site_MotionBlurScratch = 0x7f,
  ZR_Site_Module = 0x80,
  ZR_Site_ModuleLoad = 0x81,
  ZR_Site_EmptySlot = 0x82,
  ZR_Site_CallbackBlock = 0x83,
  ZR_Site_ColourEngine = 0x84,
  ZR_Site_ColourSettings = 0x85,
  ZR_Site_ColourTransform = 0x86,
  ZR_Site_DepthConvert = 0x87,
  ZR_Site_TransformWorld = 0x88,
  ZR_Site_Blur = 0x89,
  ZR_Site_WorldSuite = 0x98,
  ZR_Site_UnknownDepth = 0x3e7,
  ZR_Site_GuessAlpha = 0x90,
  ZR_Site_MatteRow = 0x91,
  ZR_Site_MatteColour = 0x92,
  ZR_Site_DrawLine = 0x93,
  ZR_Site_PaintSpot = 0x94,
  ZR_Site_Wireframe = 0x95,
  ZR_Site_Planes = 0x96,
};

// Indices of the library's own texts.
enum ZR_StringIndex : i32 {
  ZR_Str_InvalidSelector = 0,
  ZR_Str_InvalidParameter = 1,
  ZR_Str_DisposeForeignWorld = 2,
  ZR_Str_PlaneBuffer = 3,
  ZR_Str_BadCallbackParam = 4,
  ZR_Str_ModuleProblem = 5,
  ZR_Str_UnimplementedMode = 6,
  ZR_Str_NoiseTable = 7,
  ZR_Str_CannotGuessAlpha = 8,
  ZR_Str_ObsoleteRoutine = 9,
  ZR_Str_BlurMemory = 10,
  ZR_Str_MaskMemory = 11,
  ZR_Str_DamagedMask = 12,
  ZR_Str_CannotUnlockMask = 13,
  ZR_Str_GaussianWeights = 14,
  ZR_Str_BlendingScratch = 15,
  ZR_Str_ChannelWorldsDiffer = 16,
  ZR_Str_ChunkMemory = 17,
  ZR_Str_ImageBuffer = 18,
  ZR_Str_InvalidWorldForPlatformRefs = 19,
};

// The library's message table: module text, count, and strings of the form key=default text.
struct HB_StringTable;
extern "C" ZR_API const HB_StringTable* const ZR_G_zref;

// Error codes of the library. Inside, a failure is thrown as one of these values; the exported
// boundary returns it.
#pragma once

#include <cstdint>

// NOLINTNEXTLINE(readability-identifier-naming): the name is part of the contract with sibling
// libraries.
enum GRLIBError_enum : std::int32_t {
    kSuccess = 0,
    kSystemError = -1074396160,
    kNotEnoughMemory = -1074396159,
    kMemoryError = -1074396158,
    kNotInitialized = -1074396155,
    kImageTooSmall = -1074396154,
    kPoolExhausted = -1074396139,
    kNotAnImage = -1074396120,
    kNotAnObject = -1074396096,
    kPoolInUse = -1074396092,
    kPoolMissing = -1074396091,
    kPoolEnabled = -1074396090,
    kPoolExists = -1074396089,
    kOutputArrayTooSmall = -1074396088,
    kPaletteNeeds8Bit = -1074396082,
    kInvalidImageType = -1074396080,
    kIncompatibleImageType = -1074396077,
    kIncompatibleImageSize = -1074396074,
    kImageLent = -1074396065,
    kExternalBufferAlignment = -1074396063,
    kLosslessFloat = -1074396060,
    kInvalidFileHeader = -1074396000,
    kInvalidParameter = -1074395997,
    kFileNotFound = -1074395995,
    kTooManyFilesOpen = -1074395994,
    kFileIo = -1074395993,
    kFileAccessDenied = -1074395992,
    kUnsupportedFileType = -1074395991,
    kUnableToReadData = -1074395989,
    kUnableToWriteData = -1074395988,
    kInvalidFileFormat = -1074395986,
    kDiskFull = -1074395983,
    kPaletteSize = -1074395976,
    kColourSpaceMethod = -1074395974,
    kMoreThanOneLayer = -1074395973,
    kInitializationError = -1074395960,
    kQuality = -1074395956,
    kWaveletTransform = -1074395953,
    kCustomDataSize = -1074395724,
    kCustomDataKey = -1074395723,
    kBitDepth = -1074395721,
    kValueNotInEnumeration = -1074395713,
    kCompressionType = -1074395704,
    kFlattenKind = -1074395703,
    kNullPointer = -1074395269,
    kInvalidCoordinate = -1074395261,
    // The older family of the buffer-level file functions.
    kBufferNotEnoughMemory = -1074397181,  // 0xBFF60003
    kBufferNullPath = -1074397179,         // 0xBFF60005
    kBufferNullBuffer = -1074397178,       // 0xBFF60006
    kBufferReadFailed = -1074397177,       // 0xBFF60007
    kBufferKind = -1074397114,             // 0xBFF60046
    kBufferExtension = -1074397113,        // 0xBFF60047
    kBufferMode = -1074397106,             // 0xBFF6004E
    kBufferWriteFailed = -1074397104,      // 0xBFF60050
    // The same family, of Bayer decoding.
    kBayerSize = -1074397148,         // 0xBFF60024
    kBayerRedGain = -1074397075,      // 0xBFF6006D
    kBayerGreenGain = -1074397074,    // 0xBFF6006E
    kBayerBlueGain = -1074397073,     // 0xBFF6006F
    kBayerBitDepth = -1074397056,     // 0xBFF60080
    kBayerNullPointer = -1074397027,  // 0xBFF6009D
    kBayerPattern = -1074396950,      // 0xBFF600EA
};

// Numbers of the broadcast standards under the standards' own names. Each group names its standard.
#ifndef TELIX_DESKTOP_PLATFORM_DVBCONSTANTS_H
#define TELIX_DESKTOP_PLATFORM_DVBCONSTANTS_H

#include <cstddef>
#include <cstdint>

namespace desktop {

// ---- Transport stream packets: ISO/IEC 13818-1, 2.4.3

constexpr size_t kPacketSize = 188;
constexpr size_t kPacketHeaderSize = 4;
constexpr uint8_t kSyncByte = 0x47;
constexpr uint8_t kStuffingByte = 0xFF;

// Bits of the second byte of a packet.
constexpr uint8_t kTransportErrorIndicator = 0x80;
constexpr uint8_t kPayloadUnitStartIndicator = 0x40;

// Bits of the fourth byte of a packet.
constexpr uint8_t kTransportScramblingControlMask = 0xC0;
constexpr uint8_t kAdaptationFieldFlag = 0x20;
constexpr uint8_t kPayloadFlag = 0x10;
constexpr uint8_t kContinuityCounterMask = 0x0F;

// The adaptation field: flags byte, and the size of the flags and the PCR together.
constexpr uint8_t kRandomAccessIndicator = 0x40;
constexpr uint8_t kPcrFlag = 0x10;
constexpr uint8_t kAdaptationFieldWithPcrLength = 7;
constexpr uint8_t kPcrReservedBits = 0x7E; // of the fifth byte of a PCR

// The system clock has 27 MHz and counts 300 ticks for each tick of 90 kHz; a PCR, a PTS and a DTS hold 33
// bits of the latter.
constexpr int64_t kSystemClockFrequency = 27000000;
constexpr int64_t kSystemClockTicksPerBaseTick = 300;
constexpr int64_t kTimestampPeriod = int64_t{1} << 33;
constexpr int64_t kPcrPeriod = kTimestampPeriod * kSystemClockTicksPerBaseTick;

// ---- Packetized elementary streams: ISO/IEC 13818-1, 2.4.3.6 and 2.4.3.7

constexpr size_t kPesFixedHeaderSize = 9; // up to PES_header_data_length
constexpr size_t kPesTimestampSize = 5;
constexpr uint8_t kPesHeaderMarker = 0x80; // of the byte before the flags
constexpr uint8_t kPtsFlag = 0x80;
constexpr uint8_t kDtsFlag = 0x40;
constexpr uint8_t kTimestampPrefixPts = 0x30; // of a PTS that a DTS follows
constexpr uint8_t kTimestampPrefixDts = 0x10;

constexpr uint8_t kStreamIdPrivateStream1 = 0xBD;
constexpr uint8_t kStreamIdFirstAudio = 0xC0; // audio streams, and after them the video streams
constexpr uint8_t kStreamIdFirstVideo = 0xE0;
constexpr uint8_t kStreamIdLastVideo = 0xEF;
constexpr uint8_t kStreamIdExtended = 0xFD;

// ---- PIDs: ISO/IEC 13818-1, 2.4.3, and EN 300 468, 5.1.3

constexpr uint16_t kPidPat = 0x0000;
constexpr uint16_t kPidNit = 0x0010;
constexpr uint16_t kPidSdt = 0x0011;
constexpr uint16_t kPidEit = 0x0012;
constexpr uint16_t kPidTdt = 0x0014;
constexpr uint16_t kPidNullPacket = 0x1FFF;
constexpr uint16_t kPidMask = 0x1FFF;

// In a PAT, the program number under which the PID of the NIT stands.
constexpr uint16_t kProgramNumberNetwork = 0;

// ---- Sections: ISO/IEC 13818-1, 2.4.4, and EN 300 468, 5.1

constexpr size_t kSectionHeaderSize = 3; // up to section_length
constexpr size_t kLongSectionHeaderSize = 8;
constexpr size_t kCrcSize = 4;
constexpr size_t kMaxPrivateSectionSize = 4096;
constexpr uint8_t kSectionSyntaxIndicator = 0x80; // of the second byte
constexpr uint8_t kCurrentNextIndicator = 0x01;   // of the sixth byte
constexpr uint16_t kLengthMask = 0x0FFF;          // of section_length and of the lengths of loops
constexpr uint8_t kVersionCount = 32;             // version_number has five bits
constexpr uint32_t kCrcPolynomial = 0x04C11DB7;
constexpr uint32_t kCrcStart = 0xFFFFFFFF;

// Flags and reserved bits, which are set, above section_length: tables of ISO/IEC 13818, those of EN 300 468,
// and those of the latter that have no CRC.
constexpr uint16_t kMpegSectionFlags = 0xB000;
constexpr uint16_t kDvbSectionFlags = 0xF000;
constexpr uint16_t kDvbShortSectionFlags = 0x7000;

// Reserved bits, which are set, around other fields.
constexpr uint16_t kReservedBeforePid = 0xE000;
constexpr uint16_t kReservedBeforeLength = 0xF000;
constexpr uint8_t kReservedBeforeVersion = 0xC0;
constexpr uint8_t kReservedByte = 0xFF;
constexpr uint8_t kReservedBeforeEitFlags = 0xFC; // in the SDT

// table_id: ISO/IEC 13818-1; EN 300 468, 5.1.3; ISO/IEC 13818-6 for DSM-CC
constexpr uint8_t kTableIdPat = 0x00;
constexpr uint8_t kTableIdPmt = 0x02;
constexpr uint8_t kTableIdDsmccStreamDescriptors = 0x3D;
constexpr uint8_t kTableIdNitActual = 0x40;
constexpr uint8_t kTableIdSdtActual = 0x42;
constexpr uint8_t kTableIdEitActualPresentFollowing = 0x4E;
constexpr uint8_t kTableIdTdt = 0x70;
constexpr uint8_t kTableIdTot = 0x73;
constexpr uint8_t kTableIdAit = 0x74; // TS 102 809, 5.3.4

// section_number of the EIT present/following: EN 300 468, 5.2.4
constexpr uint8_t kEitSectionPresent = 0;
constexpr uint8_t kEitSectionFollowing = 1;

// running_status: EN 300 468, 5.2.3
constexpr uint8_t kRunningStatusNotRunning = 1;
constexpr uint8_t kRunningStatusRunning = 4;

// Flags of a service in the SDT: EN 300 468, 5.2.3
constexpr uint8_t kSdtEitPresentFollowingFlag = 0x01;

// ---- stream_type: ISO/IEC 13818-1, 2.4.4; ATSC A/53 part 3 for AC-3 and enhanced AC-3

constexpr uint8_t kStreamTypeMpeg1Video = 0x01;
constexpr uint8_t kStreamTypeMpeg2Video = 0x02;
constexpr uint8_t kStreamTypeMpeg1Audio = 0x03;
constexpr uint8_t kStreamTypeMpeg2Audio = 0x04;
constexpr uint8_t kStreamTypePrivateSections = 0x05;
constexpr uint8_t kStreamTypePrivatePes = 0x06;
constexpr uint8_t kStreamTypeDsmccStreamDescriptors = 0x0C;
constexpr uint8_t kStreamTypeAacAdts = 0x0F;
constexpr uint8_t kStreamTypeAacLatm = 0x11;
constexpr uint8_t kStreamTypeAvcVideo = 0x1B;
constexpr uint8_t kStreamTypeHevcVideo = 0x24;
constexpr uint8_t kStreamTypeAc3 = 0x81;
constexpr uint8_t kStreamTypeEnhancedAc3 = 0x87;

// ---- Beginnings of pictures that decode alone, after a start code: ISO/IEC 13818-2, 6.2.1; ISO/IEC
// 14496-10, 7.4.1; ISO/IEC 23008-2, 7.4.2.2

constexpr uint8_t kMpegSequenceHeaderCode = 0xB3;
constexpr uint8_t kAvcNalIdrSlice = 5;
constexpr uint8_t kAvcNalSequenceParameterSet = 7;
constexpr uint8_t kHevcNalFirstIrap = 16;
constexpr uint8_t kHevcNalLastIrap = 23;
constexpr uint8_t kHevcNalVideoParameterSet = 32;

// ---- Descriptors

constexpr size_t kDescriptorHeaderSize = 2;
constexpr size_t kMaxDescriptorBodySize = 255;

// descriptor_tag: ISO/IEC 13818-1, 2.6; ISO/IEC 13818-6 for stream events, used as TS 102 809 describes
constexpr uint8_t kTagCa = 0x09;
constexpr uint8_t kTagIso639Language = 0x0A;
constexpr uint8_t kTagStreamEvent = 0x1A;

// descriptor_tag: EN 300 468, 6.1
constexpr uint8_t kTagNetworkName = 0x40;
constexpr uint8_t kTagSatelliteDeliverySystem = 0x43;
constexpr uint8_t kTagCableDeliverySystem = 0x44;
constexpr uint8_t kTagService = 0x48;
constexpr uint8_t kTagShortEvent = 0x4D;
constexpr uint8_t kTagStreamIdentifier = 0x52;
constexpr uint8_t kTagParentalRating = 0x55;
constexpr uint8_t kTagSubtitling = 0x59;
constexpr uint8_t kTagTerrestrialDeliverySystem = 0x5A;
constexpr uint8_t kTagAc3 = 0x6A;
constexpr uint8_t kTagApplicationSignalling = 0x6F; // TS 102 809, 5.3.5.1
constexpr uint8_t kTagEnhancedAc3 = 0x7A;

// ISO 639-2 language and ISO 3166 country codes have three letters.
constexpr size_t kCodeSize = 3;

// audio_type of the ISO 639 language descriptor: ISO/IEC 13818-1, 2.6
constexpr uint8_t kAudioTypeUndefined = 0x00;
constexpr uint8_t kAudioTypeHearingImpaired = 0x02;
constexpr uint8_t kAudioTypeVisualImpairedCommentary = 0x03;

// Bodies of the descriptors that are read as a whole: the least sizes.
constexpr size_t kIso639LanguageBodySize = 4;
constexpr size_t kSubtitlingBodySize = 8;
constexpr size_t kStreamIdentifierBodySize = 1;
constexpr size_t kStreamEventFixedBodySize = 10; // eventId, reserved bits and eventNPT

// eventNPT of a "do it now" event has no meaning: TS 102 809, annex B. All bits of the first half but the
// last are reserved and set.
constexpr uint32_t kEventNptHighWithReservedBits = 0xFFFFFFFE;

// The lower 14 bits of a stream event's id are the table_id_extension of its section: TS 102 809,
// annex B
constexpr uint16_t kStreamEventIdMask = 0x3FFF;

// subtitling_type, the component_type of DVB subtitles: EN 300 468, 6.2, stream_content 3
constexpr uint8_t kSubtitlingTypeNormal = 0x10;
constexpr uint8_t kSubtitlingTypeHardOfHearing = 0x20;
constexpr uint8_t kSubtitlingTypeHardOfHearingLast = 0x25;

// rating of the parental rating descriptor: EN 300 468, 6.2. Values between these two are the age less 3;
// 0 and the values above are the broadcaster's own.
constexpr uint8_t kParentalRatingFirstAge = 0x01;
constexpr uint8_t kParentalRatingLastAge = 0x0F;
constexpr int32_t kParentalRatingAgeOffset = 3;

// service_type of the service descriptor: EN 300 468, 6.2
constexpr uint8_t kServiceTypeDigitalTelevision = 0x01;
constexpr uint8_t kServiceTypeDigitalRadio = 0x02;
constexpr uint8_t kServiceTypeAdvancedCodecRadio = 0x0A;
constexpr uint8_t kServiceTypeMpeg2HdTelevision = 0x11;
constexpr uint8_t kServiceTypeAdvancedCodecSdTelevision = 0x16;
constexpr uint8_t kServiceTypeAdvancedCodecHdTelevision = 0x19;
constexpr uint8_t kServiceTypeHevcTelevision = 0x1F;

// The first byte of a string selects its character table: EN 300 468, A.2. Any other byte from 0x20 on is a
// character of ISO/IEC 6937.
constexpr uint8_t kFirstCharacterCode = 0x20;
constexpr uint8_t kCharacterTableLastIso8859 = 0x0B; // 0x01 is ISO/IEC 8859-5, and so on
constexpr uint8_t kCharacterTableIso8859Offset = 4;
constexpr uint8_t kCharacterTableIso8859ByNumber = 0x10; // two bytes with the part follow
constexpr uint8_t kCharacterTableUcs2 = 0x11;
constexpr uint8_t kCharacterTableUtf8 = 0x15;
constexpr uint8_t kFirstControlCode = 0x80; // control codes of one byte tables, without the last one
constexpr uint8_t kControlCodesEnd = 0xA0;

// Day 0 of 1970 in the modified Julian date of times: EN 300 468, annex C
constexpr int64_t kModifiedJulianDateOf1970 = 40587;

// ---- Segments of DVB subtitles: EN 300 743, 7.2

constexpr uint8_t kSubtitlingSegmentSync = 0x0F;
constexpr uint8_t kRegionCompositionSegment = 0x11;
constexpr size_t kSubtitlingSegmentHeaderSize = 6;
constexpr size_t kSubtitlingDataHeaderSize = 2; // data_identifier and subtitle_stream_id
constexpr size_t kRegionWidthOffset = 2;        // in the body of a region composition segment

// ---- Application information table: TS 102 809, 5.3, and TS 102 796, 7.2.3

// application_type, in the table_id_extension of the section below the flag of test applications.
constexpr uint16_t kApplicationTypeHbbTv = 0x0010;
constexpr uint16_t kApplicationTypeMask = 0x7FFF;
constexpr uint16_t kTestApplicationFlag = 0x8000;

// application_control_code: TS 102 809, 5.2.4
constexpr uint8_t kControlCodeAutostart = 0x01;
constexpr uint8_t kControlCodePresent = 0x02;
constexpr uint8_t kControlCodeKill = 0x04;
constexpr uint8_t kControlCodeDisabled = 0x07;

// descriptor_tag in an AIT, which has a numbering of its own
constexpr uint8_t kTagApplication = 0x00;
constexpr uint8_t kTagApplicationName = 0x01;
constexpr uint8_t kTagTransportProtocol = 0x02;
constexpr uint8_t kTagSimpleApplicationLocation = 0x15;
constexpr uint8_t kTagApplicationUsage = 0x16;
constexpr uint8_t kTagSimpleApplicationBoundary = 0x17;

// Bits around the fields of the application signalling descriptor
constexpr uint8_t kReservedBeforeAitVersion = 0xE0;
constexpr size_t kAitSignallingEntrySize = 3;

// protocol_id of the transport protocol descriptor
constexpr uint16_t kTransportProtocolHttp = 0x0003;

// The byte of the application descriptor with service_bound_flag, visibility and reserved bits, which are set
constexpr uint8_t kServiceBoundFlag = 0x80;
constexpr uint8_t kVisibilityMask = 0x03;
constexpr uint8_t kVisibilityShift = 5;
constexpr uint8_t kReservedAfterVisibility = 0x1F;
constexpr uint8_t kVisibilityAll = 0x03; // to the viewer, and to applications

// usage_type of the application usage descriptor
constexpr uint8_t kUsageNone = 0x00; // no such descriptor
constexpr uint8_t kUsageDigitalText = 0x01;

// ---- original_network_id: the values from here on are for private use, TS 101 162

constexpr uint16_t kFirstPrivateNetworkId = 0xFF01;

} // namespace desktop

#endif

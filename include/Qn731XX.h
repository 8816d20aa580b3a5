/* The C API of the Quorlen731XX oscilloscope driver.
 *
 * A session handle (ViSession) comes from Qn731XX_init or
 * Qn731XX_InitWithOptions and is ended by Qn731XX_close. Every function returns
 * a ViStatus: 0 for success, a positive warning, or a negative error whose
 * description Qn731XX_GetError returns (for session 0 when no session was
 * created). Text results follow one rule: with a null buffer or a size of 0
 * nothing is written and the size needed (length + 1) is returned; a buffer
 * too small receives a truncated, terminated copy and the size needed is
 * returned; otherwise the whole text is copied and 0 is returned.
 *
 * Plain C99; also usable from C++. */
#ifndef QN731XX_H
#define QN731XX_H

#include "visatype.h"

#if defined(__GNUC__)
#define QN731XX_API __attribute__((visibility("default")))
#else
#define QN731XX_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* ------------------------------------------------------------------------ */
/* Status codes                                                              */
/* ------------------------------------------------------------------------ */

#define QN731XX_STATUS(bits) ((ViStatus)(VI_STATUS_ERROR_BASE + (bits)))

/* Generic failure: a null pointer given for a result, or a failure that has
 * no status of its own. */
#define QN731XX_ERROR_FAILURE QN731XX_STATUS(0x00000000L)

/* Driver errors. */
#define QN731XX_ERROR_PROPERTY_NOT_SUPPORTED QN731XX_STATUS(0x3FFA4001L)
#define QN731XX_ERROR_SETTINGS_CONFLICT QN731XX_STATUS(0x3FFA4002L)
#define QN731XX_ERROR_UNKNOWN_SOURCE QN731XX_STATUS(0x3FFA4003L)
#define QN731XX_ERROR_CHANNEL_COUPLING QN731XX_STATUS(0x3FFA4004L)
#define QN731XX_ERROR_VERTICAL_GROUND_COUPLING QN731XX_STATUS(0x3FFA4005L)
#define QN731XX_ERROR_IO_GENERAL QN731XX_STATUS(0x3FFA4214L)
#define QN731XX_ERROR_IO_TIMEOUT QN731XX_STATUS(0x3FFA4215L)
#define QN731XX_ERROR_MODEL_NOT_SUPPORTED QN731XX_STATUS(0x3FFA4216L)
#define QN731XX_ERROR_MAX_TIME_EXCEEDED QN731XX_STATUS(0x3FFA4217L)
#define QN731XX_ERROR_WRAPPED_DRIVER_ERROR QN731XX_STATUS(0x3FFA4218L)
#define QN731XX_ERROR_MEAS_CONFIG_ERROR QN731XX_STATUS(0x3FFA4219L)
#define QN731XX_ERROR_INVALID_WAVEFORM_ELEMENT QN731XX_STATUS(0x3FFA421BL)

/* Oscilloscope class statuses. */
#define IVISCOPE_WARN_INVALID_WFM_ELEMENT ((ViStatus)0x3FFA2001L)
#define IVISCOPE_ERROR_CHANNEL_NOT_ENABLED QN731XX_STATUS(0x3FFA2001L)
#define IVISCOPE_ERROR_UNABLE_TO_PERFORM_MEASUREMENT QN731XX_STATUS(0x3FFA2002L)
#define IVISCOPE_ERROR_MAX_TIME_EXCEEDED QN731XX_STATUS(0x3FFA2003L)
#define IVISCOPE_ERROR_INVALID_ACQ_TYPE QN731XX_STATUS(0x3FFA2004L)

/* Inherent statuses. */
#define IVI_WARN_NSUP_ID_QUERY ((ViStatus)0x3FFA0065L)
#define IVI_WARN_NSUP_RESET ((ViStatus)0x3FFA0066L)
#define IVI_WARN_NSUP_SELF_TEST ((ViStatus)0x3FFA0067L)
#define IVI_WARN_NSUP_ERROR_QUERY ((ViStatus)0x3FFA0068L)
#define IVI_WARN_NSUP_REV_QUERY ((ViStatus)0x3FFA0069L)
#define IVI_ERROR_CANNOT_RECOVER QN731XX_STATUS(0x3FFA0000L)
#define IVI_ERROR_INSTRUMENT_STATUS QN731XX_STATUS(0x3FFA0001L)
#define IVI_ERROR_CANNOT_OPEN_FILE QN731XX_STATUS(0x3FFA0002L)
#define IVI_ERROR_READING_FILE QN731XX_STATUS(0x3FFA0003L)
#define IVI_ERROR_WRITING_FILE QN731XX_STATUS(0x3FFA0004L)
#define IVI_ERROR_INVALID_PATHNAME QN731XX_STATUS(0x3FFA000BL)
#define IVI_ERROR_INVALID_ATTRIBUTE QN731XX_STATUS(0x3FFA000CL)
#define IVI_ERROR_ATTR_NOT_WRITABLE QN731XX_STATUS(0x3FFA000DL)
#define IVI_ERROR_INVALID_VALUE QN731XX_STATUS(0x3FFA0010L)
#define IVI_ERROR_FUNCTION_NOT_SUPPORTED QN731XX_STATUS(0x3FFA0011L)
#define IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED QN731XX_STATUS(0x3FFA0012L)
#define IVI_ERROR_VALUE_NOT_SUPPORTED QN731XX_STATUS(0x3FFA0013L)
#define IVI_ERROR_TYPES_DO_NOT_MATCH QN731XX_STATUS(0x3FFA0015L)
#define IVI_ERROR_NOT_INITIALIZED QN731XX_STATUS(0x3FFA001DL)
#define IVI_ERROR_UNKNOWN_CHANNEL_NAME QN731XX_STATUS(0x3FFA0020L)
#define IVI_ERROR_TOO_MANY_OPEN_FILES QN731XX_STATUS(0x3FFA0023L)
#define IVI_ERROR_CHANNEL_NAME_REQUIRED QN731XX_STATUS(0x3FFA0044L)
#define IVI_ERROR_MISSING_OPTION_NAME QN731XX_STATUS(0x3FFA0049L)
#define IVI_ERROR_MISSING_OPTION_VALUE QN731XX_STATUS(0x3FFA004AL)
#define IVI_ERROR_BAD_OPTION_NAME QN731XX_STATUS(0x3FFA004BL)
#define IVI_ERROR_BAD_OPTION_VALUE QN731XX_STATUS(0x3FFA004CL)
#define IVI_ERROR_OUT_OF_MEMORY QN731XX_STATUS(0x3FFA0056L)
#define IVI_ERROR_OPERATION_PENDING QN731XX_STATUS(0x3FFA0057L)
#define IVI_ERROR_NULL_POINTER QN731XX_STATUS(0x3FFA0058L)
#define IVI_ERROR_UNEXPECTED_RESPONSE QN731XX_STATUS(0x3FFA0059L)
#define IVI_ERROR_FILE_NOT_FOUND QN731XX_STATUS(0x3FFA005BL)
#define IVI_ERROR_INVALID_FILE_FORMAT QN731XX_STATUS(0x3FFA005CL)
#define IVI_ERROR_STATUS_NOT_AVAILABLE QN731XX_STATUS(0x3FFA005DL)
#define IVI_ERROR_ID_QUERY_FAILED QN731XX_STATUS(0x3FFA005EL)
#define IVI_ERROR_RESET_FAILED QN731XX_STATUS(0x3FFA005FL)
#define IVI_ERROR_RESOURCE_UNKNOWN QN731XX_STATUS(0x3FFA0060L)
#define IVI_ERROR_ALREADY_INITIALIZED QN731XX_STATUS(0x3FFA0061L)
#define IVI_ERROR_CANNOT_CHANGE_SIMULATION_STATE QN731XX_STATUS(0x3FFA0062L)
#define IVI_ERROR_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR QN731XX_STATUS(0x3FFA0063L)
#define IVI_ERROR_INVALID_RANGE_IN_SELECTOR QN731XX_STATUS(0x3FFA0064L)
#define IVI_ERROR_UNKNOWN_NAME_IN_SELECTOR QN731XX_STATUS(0x3FFA0065L)
#define IVI_ERROR_BADLY_FORMED_SELECTOR QN731XX_STATUS(0x3FFA0066L)
#define IVI_ERROR_UNKNOWN_PHYSICAL_IDENTIFIER QN731XX_STATUS(0x3FFA0067L)

/* Statuses of the session library (invalid or closed session, and the like). */
#define QN731XX_ERROR_INVALID_SESSION QN731XX_STATUS(0x3FFF000EL)
#define QN731XX_ERROR_SESSION_NOT_LOCKED QN731XX_STATUS(0x3FFF009CL)

/* ------------------------------------------------------------------------ */
/* Attribute IDs                                                             */
/* ------------------------------------------------------------------------ */

#define IVI_ATTR_BASE 1050000L
#define IVISCOPE_ATTR_BASE 1250000L
#define QN731XX_ATTR_BASE 1150000L

/* Inherent attributes. */
#define IVI_ATTR_RANGE_CHECK (IVI_ATTR_BASE + 2L)
#define IVI_ATTR_QUERY_INSTRUMENT_STATUS (IVI_ATTR_BASE + 3L)
#define IVI_ATTR_CACHE (IVI_ATTR_BASE + 4L)
#define IVI_ATTR_SIMULATE (IVI_ATTR_BASE + 5L)
#define IVI_ATTR_RECORD_COERCIONS (IVI_ATTR_BASE + 6L)
#define IVI_ATTR_DRIVER_SETUP (IVI_ATTR_BASE + 7L)
#define IVI_ATTR_INTERCHANGE_CHECK (IVI_ATTR_BASE + 21L)
#define IVI_ATTR_CHANNEL_COUNT (IVI_ATTR_BASE + 203L)
#define IVI_ATTR_IO_RESOURCE_DESCRIPTOR (IVI_ATTR_BASE + 304L)
#define IVI_ATTR_LOGICAL_NAME (IVI_ATTR_BASE + 305L)
#define IVI_ATTR_SUPPORTED_INSTRUMENT_MODELS (IVI_ATTR_BASE + 327L)
#define IVI_ATTR_GROUP_CAPABILITIES (IVI_ATTR_BASE + 401L)
#define IVI_ATTR_INSTRUMENT_FIRMWARE_REVISION (IVI_ATTR_BASE + 510L)
#define IVI_ATTR_INSTRUMENT_MANUFACTURER (IVI_ATTR_BASE + 511L)
#define IVI_ATTR_INSTRUMENT_MODEL (IVI_ATTR_BASE + 512L)
#define IVI_ATTR_SPECIFIC_DRIVER_VENDOR (IVI_ATTR_BASE + 513L)
#define IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION (IVI_ATTR_BASE + 514L)
#define IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION (IVI_ATTR_BASE + 515L)
#define IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION (IVI_ATTR_BASE + 516L)
#define IVI_ATTR_SPECIFIC_DRIVER_REVISION (IVI_ATTR_BASE + 551L)

/* Oscilloscope class attributes (class enumeration values). */
#define IVISCOPE_ATTR_VERTICAL_RANGE (IVISCOPE_ATTR_BASE + 1L)
#define IVISCOPE_ATTR_VERTICAL_OFFSET (IVISCOPE_ATTR_BASE + 2L)
#define IVISCOPE_ATTR_VERTICAL_COUPLING (IVISCOPE_ATTR_BASE + 3L)
#define IVISCOPE_ATTR_PROBE_ATTENUATION (IVISCOPE_ATTR_BASE + 4L)
#define IVISCOPE_ATTR_CHANNEL_ENABLED (IVISCOPE_ATTR_BASE + 5L)
#define IVISCOPE_ATTR_MAX_INPUT_FREQUENCY (IVISCOPE_ATTR_BASE + 6L)
#define IVISCOPE_ATTR_HORZ_TIME_PER_RECORD (IVISCOPE_ATTR_BASE + 7L)
#define IVISCOPE_ATTR_HORZ_RECORD_LENGTH (IVISCOPE_ATTR_BASE + 8L)
#define IVISCOPE_ATTR_HORZ_MIN_NUM_PTS (IVISCOPE_ATTR_BASE + 9L)
#define IVISCOPE_ATTR_HORZ_SAMPLE_RATE (IVISCOPE_ATTR_BASE + 10L)
#define IVISCOPE_ATTR_TRIGGER_TYPE (IVISCOPE_ATTR_BASE + 12L)
#define IVISCOPE_ATTR_TRIGGER_SOURCE (IVISCOPE_ATTR_BASE + 13L)
#define IVISCOPE_ATTR_TRIGGER_COUPLING (IVISCOPE_ATTR_BASE + 14L)
#define IVISCOPE_ATTR_TRIGGER_HOLDOFF (IVISCOPE_ATTR_BASE + 16L)
#define IVISCOPE_ATTR_TRIGGER_LEVEL (IVISCOPE_ATTR_BASE + 17L)
#define IVISCOPE_ATTR_TRIGGER_SLOPE (IVISCOPE_ATTR_BASE + 18L)
#define IVISCOPE_ATTR_INTERPOLATION (IVISCOPE_ATTR_BASE + 19L)
#define IVISCOPE_ATTR_ACQUISITION_TYPE (IVISCOPE_ATTR_BASE + 101L)
#define IVISCOPE_ATTR_TRIGGER_MODIFIER (IVISCOPE_ATTR_BASE + 102L)
#define IVISCOPE_ATTR_INPUT_IMPEDANCE (IVISCOPE_ATTR_BASE + 103L)
#define IVISCOPE_ATTR_NUM_AVERAGES (IVISCOPE_ATTR_BASE + 104L)
#define IVISCOPE_ATTR_NUM_ENVELOPES (IVISCOPE_ATTR_BASE + 105L)
#define IVISCOPE_ATTR_SAMPLE_MODE (IVISCOPE_ATTR_BASE + 106L)
#define IVISCOPE_ATTR_INITIATE_CONTINUOUS (IVISCOPE_ATTR_BASE + 107L)
#define IVISCOPE_ATTR_PROBE_SENSE_VALUE (IVISCOPE_ATTR_BASE + 108L)
#define IVISCOPE_ATTR_ACQUISITION_START_TIME (IVISCOPE_ATTR_BASE + 109L)
#define IVISCOPE_ATTR_TV_TRIGGER_SIGNAL_FORMAT (IVISCOPE_ATTR_BASE + 201L)
#define IVISCOPE_ATTR_TV_TRIGGER_POLARITY (IVISCOPE_ATTR_BASE + 204L)
#define IVISCOPE_ATTR_TV_TRIGGER_EVENT (IVISCOPE_ATTR_BASE + 205L)
#define IVISCOPE_ATTR_TV_TRIGGER_LINE_NUMBER (IVISCOPE_ATTR_BASE + 206L)
#define IVISCOPE_ATTR_RUNT_HIGH_THRESHOLD (IVISCOPE_ATTR_BASE + 301L)
#define IVISCOPE_ATTR_RUNT_LOW_THRESHOLD (IVISCOPE_ATTR_BASE + 302L)
#define IVISCOPE_ATTR_RUNT_POLARITY (IVISCOPE_ATTR_BASE + 303L)
#define IVISCOPE_ATTR_GLITCH_WIDTH (IVISCOPE_ATTR_BASE + 401L)
#define IVISCOPE_ATTR_GLITCH_POLARITY (IVISCOPE_ATTR_BASE + 402L)
#define IVISCOPE_ATTR_GLITCH_CONDITION (IVISCOPE_ATTR_BASE + 403L)
#define IVISCOPE_ATTR_WIDTH_LOW_THRESHOLD (IVISCOPE_ATTR_BASE + 501L)
#define IVISCOPE_ATTR_WIDTH_HIGH_THRESHOLD (IVISCOPE_ATTR_BASE + 502L)
#define IVISCOPE_ATTR_WIDTH_POLARITY (IVISCOPE_ATTR_BASE + 503L)
#define IVISCOPE_ATTR_WIDTH_CONDITION (IVISCOPE_ATTR_BASE + 504L)
#define IVISCOPE_ATTR_MEAS_HIGH_REF (IVISCOPE_ATTR_BASE + 607L)
#define IVISCOPE_ATTR_MEAS_LOW_REF (IVISCOPE_ATTR_BASE + 608L)
#define IVISCOPE_ATTR_MEAS_MID_REF (IVISCOPE_ATTR_BASE + 609L)
#define IVISCOPE_ATTR_AC_LINE_TRIGGER_SLOPE (IVISCOPE_ATTR_BASE + 701L)

/* Driver-specific attributes (driver enumeration values). */
#define QN731XX_ATTR_CHANNEL_LABEL (QN731XX_ATTR_BASE + 8L)
#define QN731XX_ATTR_CHANNEL_INVERT (QN731XX_ATTR_BASE + 15L)
#define QN731XX_ATTR_CHANNEL_PROBE_SKEW (QN731XX_ATTR_BASE + 20L)
#define QN731XX_ATTR_CHANNEL_PROTECTION (QN731XX_ATTR_BASE + 21L)
#define QN731XX_ATTR_CHANNEL_UNITS (QN731XX_ATTR_BASE + 23L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_EDGE_OCCURRENCE (QN731XX_ATTR_BASE + 24L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_EDGE_SLOPE (QN731XX_ATTR_BASE + 25L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_OCCURRENCE (QN731XX_ATTR_BASE + 26L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_SLOPE (QN731XX_ATTR_BASE + 27L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_VALUE (QN731XX_ATTR_BASE + 28L)
#define QN731XX_ATTR_CONFIGURABLEMEASUREMENT_VALUE_AT_TIME_TIME (QN731XX_ATTR_BASE + 29L)
#define QN731XX_ATTR_CURSORS_ENABLED (QN731XX_ATTR_BASE + 30L)
#define QN731XX_ATTR_CURSORS_X1_POSITION (QN731XX_ATTR_BASE + 31L)
#define QN731XX_ATTR_CURSORS_X1Y1_SOURCE (QN731XX_ATTR_BASE + 32L)
#define QN731XX_ATTR_CURSORS_X2_POSITION (QN731XX_ATTR_BASE + 33L)
#define QN731XX_ATTR_CURSORS_X2Y2_SOURCE (QN731XX_ATTR_BASE + 34L)
#define QN731XX_ATTR_CURSORS_Y1_POSITION (QN731XX_ATTR_BASE + 35L)
#define QN731XX_ATTR_CURSORS_Y2_POSITION (QN731XX_ATTR_BASE + 36L)
#define QN731XX_ATTR_DIGITALCHANNEL_ENABLED (QN731XX_ATTR_BASE + 37L)
#define QN731XX_ATTR_DIGITALCHANNEL_LABEL (QN731XX_ATTR_BASE + 38L)
#define QN731XX_ATTR_DIGITALCHANNEL_THRESHOLD (QN731XX_ATTR_BASE + 39L)
#define QN731XX_ATTR_DISPLAY_LABEL_ENABLED (QN731XX_ATTR_BASE + 40L)
#define QN731XX_ATTR_DISPLAY_PERSISTENCE (QN731XX_ATTR_BASE + 41L)
#define QN731XX_ATTR_EXTERNAL_PROBE_ATTENUATION (QN731XX_ATTR_BASE + 43L)
#define QN731XX_ATTR_EXTERNAL_PROBE_SENSE (QN731XX_ATTR_BASE + 44L)
#define QN731XX_ATTR_EXTERNAL_UNITS (QN731XX_ATTR_BASE + 45L)
#define QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_OCCURENCE1 (QN731XX_ATTR_BASE + 46L)
#define QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_OCCURENCE2 (QN731XX_ATTR_BASE + 47L)
#define QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_SLOPE1 (QN731XX_ATTR_BASE + 48L)
#define QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_SLOPE2 (QN731XX_ATTR_BASE + 49L)
#define QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_SOURCE2 (QN731XX_ATTR_BASE + 50L)
#define QN731XX_ATTR_STATUS_SERIAL_POLL (QN731XX_ATTR_BASE + 54L)
#define QN731XX_ATTR_SYSTEM_DATE (QN731XX_ATTR_BASE + 56L)
#define QN731XX_ATTR_SYSTEM_SERIAL_NUMBER (QN731XX_ATTR_BASE + 57L)
#define QN731XX_ATTR_SYSTEM_TIME (QN731XX_ATTR_BASE + 58L)
#define QN731XX_ATTR_SYSTEM_TIMEOUT_MILLISECONDS (QN731XX_ATTR_BASE + 59L)
#define QN731XX_ATTR_SYSTEM_TRACE_ENABLED (QN731XX_ATTR_BASE + 60L)
#define QN731XX_ATTR_TRIGGER_RUNT_POLARITY (QN731XX_ATTR_BASE + 73L)
#define QN731XX_ATTR_TRIGGER_RUNT_THRESHOLD_HIGH (QN731XX_ATTR_BASE + 74L)
#define QN731XX_ATTR_TRIGGER_RUNT_THRESHOLD_LOW (QN731XX_ATTR_BASE + 75L)
#define QN731XX_ATTR_TRIGGER_TV_EVENT (QN731XX_ATTR_BASE + 76L)
#define QN731XX_ATTR_TRIGGER_STATE_ANALOG_MASK (QN731XX_ATTR_BASE + 80L)
#define QN731XX_ATTR_TRIGGER_STATE_ANALOG_PATTERN (QN731XX_ATTR_BASE + 81L)
#define QN731XX_ATTR_TRIGGER_STATE_CLOCK_SLOPE (QN731XX_ATTR_BASE + 82L)
#define QN731XX_ATTR_TRIGGER_STATE_CLOCK_SOURCE (QN731XX_ATTR_BASE + 83L)
#define QN731XX_ATTR_TRIGGER_STATE_DIGITAL_MASK (QN731XX_ATTR_BASE + 84L)
#define QN731XX_ATTR_TRIGGER_STATE_DIGITAL_PATTERN (QN731XX_ATTR_BASE + 85L)
#define QN731XX_ATTR_TRIGGER_PATTERN_ANALOG_MASK (QN731XX_ATTR_BASE + 86L)
#define QN731XX_ATTR_TRIGGER_PATTERN_ANALOG_PATTERN (QN731XX_ATTR_BASE + 87L)
#define QN731XX_ATTR_TRIGGER_PATTERN_CONDITION (QN731XX_ATTR_BASE + 88L)
#define QN731XX_ATTR_TRIGGER_PATTERN_DIGITAL_MASK (QN731XX_ATTR_BASE + 89L)
#define QN731XX_ATTR_TRIGGER_PATTERN_DIGITAL_PATTERN (QN731XX_ATTR_BASE + 90L)
/* Item counts of the measurement and digital-channel collections. */
#define QN731XX_ATTR_MEASUREMENT_COUNT (QN731XX_ATTR_BASE + 610L)
#define QN731XX_ATTR_DIGITALCHANNEL_COUNT (QN731XX_ATTR_BASE + 630L)

/* ------------------------------------------------------------------------ */
/* Enumeration values                                                        */
/* ------------------------------------------------------------------------ */

#define QN731XX_VAL_INTERPOLATION_NONE 1L
#define QN731XX_VAL_INTERPOLATION_SINE_X 2L
#define QN731XX_VAL_INTERPOLATION_LINEAR 3L
#define QN731XX_VAL_SAMPLE_MODE_REAL_TIME 0L
#define QN731XX_VAL_SAMPLE_MODE_EQUIVALENT_TIME 1L
#define QN731XX_VAL_ACQUISITION_TYPE_NORMAL 0L
#define QN731XX_VAL_ACQUISITION_TYPE_PEAK_DETECT 1L
#define QN731XX_VAL_ACQUISITION_TYPE_HI_RES 2L
#define QN731XX_VAL_ACQUISITION_TYPE_ENVELOPE 3L
#define QN731XX_VAL_ACQUISITION_TYPE_AVERAGE 4L
#define QN731XX_VAL_VERTICAL_COUPLING_AC 0L
#define QN731XX_VAL_VERTICAL_COUPLING_DC 1L
#define QN731XX_VAL_VERTICAL_COUPLING_GND 2L
#define QN731XX_VAL_CHANNEL_PROTECTION_OK 0L
#define QN731XX_VAL_CHANNEL_PROTECTION_TRIPPED 1L
#define QN731XX_VAL_VOLTS 0L
#define QN731XX_VAL_AMPS 1L
#define QN731XX_VAL_STATUS_REGISTER_STATUS_BYTE 0L
#define QN731XX_VAL_STATUS_REGISTER_STANDARD_EVENT 1L
#define QN731XX_VAL_STATUS_REGISTER_OPERATION 2L
#define QN731XX_VAL_STATUS_REGISTER_OVERLOAD_EVENT 3L
#define QN731XX_VAL_STATUS_REGISTER_TRIGGER_EVENT 4L
#define QN731XX_VAL_STATUS_REGISTER_ARM_EVENT 5L
#define QN731XX_VAL_STATUS_SUB_REGISTER_CONDITION 0L
#define QN731XX_VAL_STATUS_SUB_REGISTER_EVENT 1L
#define QN731XX_VAL_STATUS_SUB_REGISTER_ENABLE 2L
#define QN731XX_VAL_SRQ_REASON_STB_MAV 1L
#define QN731XX_VAL_SRQ_REASON_STB_MSG 2L
#define QN731XX_VAL_SRQ_REASON_ESR_OPC 4L
#define QN731XX_VAL_SRQ_REASON_ESR_QUERY_ERROR 8L
#define QN731XX_VAL_SRQ_REASON_ESR_DEVICE_ERROR 16L
#define QN731XX_VAL_SRQ_REASON_ESR_EXECUTION_ERROR 32L
#define QN731XX_VAL_SRQ_REASON_ESR_COMMAND_ERROR 64L
#define QN731XX_VAL_SRQ_REASON_ESR_USER_REQUEST 128L
#define QN731XX_VAL_SRQ_REASON_ESR_POWER_ON 256L
#define QN731XX_VAL_SRQ_REASON_STB_USR 1024L
#define QN731XX_VAL_SRQ_REASON_STB_TRG 2048L
#define QN731XX_VAL_SRQ_REASON_OPER_RUNNING 8192L
#define QN731XX_VAL_SRQ_REASON_OPER_WAIT_TRIG 16384L
#define QN731XX_VAL_SRQ_REASON_OVERLOAD_CHAN1 32768L
#define QN731XX_VAL_SRQ_REASON_OVERLOAD_CHAN2 65536L
#define QN731XX_VAL_SRQ_REASON_OVERLOAD_CHAN3 131072L
#define QN731XX_VAL_SRQ_REASON_OVERLOAD_CHAN4 262144L
#define QN731XX_VAL_SRQ_REASON_OVERLOAD_EXTERNAL 524288L
#define QN731XX_VAL_SRQ_REASON_FAULT_CHAN1 1048576L
#define QN731XX_VAL_SRQ_REASON_FAULT_CHAN2 2097152L
#define QN731XX_VAL_SRQ_REASON_FAULT_CHAN3 4194304L
#define QN731XX_VAL_SRQ_REASON_FAULT_CHAN4 8388608L
#define QN731XX_VAL_SRQ_REASON_FAULT_EXTERNAL 16777216L
#define QN731XX_VAL_ACQ_IN_PROGRESS 0L
#define QN731XX_VAL_ACQ_COMPLETE 1L
#define QN731XX_VAL_ACQ_STATUS_UNKNOWN 2L
#define QN731XX_VAL_TIME_OUT_IMMEDIATE 0L
#define QN731XX_VAL_TIME_OUT_INFINITE 1L
#define QN731XX_VAL_MEASUREMENT_RISE_TIME 0L
#define QN731XX_VAL_MEASUREMENT_FALL_TIME 1L
#define QN731XX_VAL_MEASUREMENT_FREQUENCY 2L
#define QN731XX_VAL_MEASUREMENT_PERIOD 3L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_RMS 4L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_PEAK_TO_PEAK 5L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_MAX 6L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_MIN 7L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_HIGH 8L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_LOW 9L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_AVERAGE 10L
#define QN731XX_VAL_MEASUREMENT_WIDTH_NEG 11L
#define QN731XX_VAL_MEASUREMENT_WIDTH_POS 12L
#define QN731XX_VAL_MEASUREMENT_DUTY_CYCLE_NEG 13L
#define QN731XX_VAL_MEASUREMENT_DUTY_CYCLE_POS 14L
#define QN731XX_VAL_MEASUREMENT_AMPLITUDE 15L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_CYCLE_RMS 16L
#define QN731XX_VAL_MEASUREMENT_VOLTAGE_CYCLE_AVERAGE 17L
#define QN731XX_VAL_MEASUREMENT_OVER_SHOOT 18L
#define QN731XX_VAL_MEASUREMENT_PRESHOOT 19L
#define QN731XX_VAL_MEASUREMENT_FREQUENCY_COUNTER 20L
#define QN731XX_VAL_MEASUREMENT_TIME_AT_MAX 21L
#define QN731XX_VAL_MEASUREMENT_TIME_AT_MIN 22L
#define QN731XX_VAL_MEASUREMENT_DELAY 23L
#define QN731XX_VAL_MEASUREMENT_PHASE 24L
#define QN731XX_VAL_MEASUREMENT_VALUE_AT_TIME 25L
#define QN731XX_VAL_MEASUREMENT_TIME_AT_VALUE 26L
#define QN731XX_VAL_MEASUREMENT_TIME_OF_EDGE 27L
#define QN731XX_VAL_MEASUREMENT_SLOPE_POSITIVE 0L
#define QN731XX_VAL_MEASUREMENT_SLOPE_NEGATIVE 1L
#define QN731XX_VAL_MEASUREMENT_REFERENCE_MODE_PERCENT 0L
#define QN731XX_VAL_MEASUREMENT_REFERENCE_MODE_ABSOLUTE 1L
#define QN731XX_VAL_UNITS_VOLTS 0L
#define QN731XX_VAL_UNITS_AMPS 1L
#define QN731XX_VAL_TRIGGER_EDGE 1L
#define QN731XX_VAL_TRIGGER_WIDTH 2L
#define QN731XX_VAL_TRIGGER_RUNT 3L
#define QN731XX_VAL_TRIGGER_GLITCH 4L
#define QN731XX_VAL_TRIGGER_TV 5L
#define QN731XX_VAL_TRIGGER_IMMEDIATE 6L
#define QN731XX_VAL_TRIGGER_AC_LINE 7L
#define QN731XX_VAL_TRIGGER_PATTERN 8L
#define QN731XX_VAL_TRIGGER_STATE 9L
#define QN731XX_VAL_TRIGGER_COUPLING_AC 0L
#define QN731XX_VAL_TRIGGER_COUPLING_DC 1L
#define QN731XX_VAL_TRIGGER_COUPLING_HF_REJECT 2L
#define QN731XX_VAL_TRIGGER_COUPLING_LF_REJECT 3L
#define QN731XX_VAL_TRIGGER_COUPLING_NOISE_REJECT 4L
#define QN731XX_VAL_TRIGGER_COUPLING_TV 5L
#define QN731XX_VAL_TRIGGER_MODIFIER_NONE 1L
#define QN731XX_VAL_TRIGGER_MODIFIER_AUTO 2L
#define QN731XX_VAL_TRIGGER_MODIFIER_AUTO_LEVEL 3L
#define QN731XX_VAL_TRIGGER_SLOPE_NEGATIVE 0L
#define QN731XX_VAL_TRIGGER_SLOPE_POSITIVE 1L
#define QN731XX_VAL_TRIGGER_SLOPE_EITHER 2L
#define QN731XX_VAL_TRIGGER_SLOPE_ALTERNATE 3L
#define QN731XX_VAL_AC_LINE_POSITIVE 1L
#define QN731XX_VAL_AC_LINE_NEGATIVE 2L
#define QN731XX_VAL_AC_LINE_EITHER 3L
#define QN731XX_VAL_GLITCH_LESS_THAN 1L
#define QN731XX_VAL_GLITCH_GREATER_THAN 2L
#define QN731XX_VAL_GLITCH_POSITIVE 1L
#define QN731XX_VAL_GLITCH_NEGATIVE 2L
#define QN731XX_VAL_GLITCH_EITHER 3L
#define QN731XX_VAL_WIDTH_WITHIN 1L
#define QN731XX_VAL_WIDTH_OUTSIDE 2L
#define QN731XX_VAL_WIDTH_POSITIVE 1L
#define QN731XX_VAL_WIDTH_NEGATIVE 2L
#define QN731XX_VAL_WIDTH_EITHER 3L
#define QN731XX_VAL_RUNT_POLARITY_POSITIVE 1L
#define QN731XX_VAL_RUNT_POLARITY_NEGATIVE 2L
#define QN731XX_VAL_RUNT_POLARITY_EITHER 3L
#define QN731XX_VAL_TV_EVENT_FIELD1 1L
#define QN731XX_VAL_TV_EVENT_FIELD2 2L
#define QN731XX_VAL_TV_EVENT_ANY_FIELD 3L
#define QN731XX_VAL_TV_EVENT_ANY_LINE 4L
#define QN731XX_VAL_TV_EVENT_LINE_NUMBER 5L
#define QN731XX_VAL_TV_EVENT_LINE_NUMBER_ALTERNATE 6L
#define QN731XX_VAL_TV_EVENT_LINE_NUMBER_VERTICAL 7L
#define QN731XX_VAL_TV_EVENT_VERTICAL 8L
#define QN731XX_VAL_TV_TRIGGER_POSITIVE 1L
#define QN731XX_VAL_TV_TRIGGER_NEGATIVE 2L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_NTSC 1L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_PAL 2L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_SECAM 3L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_PALM 4L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_GENERIC 5L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_P480 6L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_P720 7L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_P1080 8L
#define QN731XX_VAL_TV_SIGNAL_FORMAT_I1080 9L
#define QN731XX_VAL_PATTERN_ENTER 0L
#define QN731XX_VAL_PATTERN_EXIT 1L

/* ------------------------------------------------------------------------ */
/* Sessions and errors                                                       */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_init(ViRsrc resourceName, ViBoolean idQuery, ViBoolean reset,
                                  ViSession *vi);
QN731XX_API ViStatus Qn731XX_InitWithOptions(ViRsrc resourceName, ViBoolean idQuery,
                                             ViBoolean reset, ViConstString optionString,
                                             ViSession *vi);
QN731XX_API ViStatus Qn731XX_close(ViSession vi);
/* Binds a session to a driver object that exists already (its IUnknown);
 * the session holds one reference until Qn731XX_close. */
QN731XX_API ViStatus Qn731XX_AttachToExistingCOMSession(void *existingIUnknown, ViSession *vi);
/* The driver object of a session, with a reference the caller releases. */
QN731XX_API ViStatus Qn731XX_GetNativeIUnknownPtr(ViSession vi, void **nativeIUnknown);
QN731XX_API ViStatus Qn731XX_LockSession(ViSession vi, ViBoolean *callerHasLock);
QN731XX_API ViStatus Qn731XX_UnlockSession(ViSession vi, ViBoolean *callerHasLock);
QN731XX_API ViStatus Qn731XX_GetError(ViSession vi, ViStatus *errorCode, ViInt32 bufferSize,
                                      ViChar description[]);
QN731XX_API ViStatus Qn731XX_ClearError(ViSession vi);
/* The text of a status code (at most 255 characters and the terminator). */
QN731XX_API ViStatus Qn731XX_error_message(ViSession vi, ViStatus errorCode,
                                           ViChar errorMessage[256]);

/* ------------------------------------------------------------------------ */
/* Attributes                                                                */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_GetAttributeViInt32(ViSession vi, ViConstString repCapIdentifier,
                                                 ViAttr attributeId, ViInt32 *value);
QN731XX_API ViStatus Qn731XX_GetAttributeViReal64(ViSession vi, ViConstString repCapIdentifier,
                                                  ViAttr attributeId, ViReal64 *value);
QN731XX_API ViStatus Qn731XX_GetAttributeViBoolean(ViSession vi, ViConstString repCapIdentifier,
                                                   ViAttr attributeId, ViBoolean *value);
QN731XX_API ViStatus Qn731XX_GetAttributeViString(ViSession vi, ViConstString repCapIdentifier,
                                                  ViAttr attributeId, ViInt32 bufferSize,
                                                  ViChar value[]);
QN731XX_API ViStatus Qn731XX_GetAttributeViSession(ViSession vi, ViConstString repCapIdentifier,
                                                   ViAttr attributeId, ViSession *value);
QN731XX_API ViStatus Qn731XX_SetAttributeViInt32(ViSession vi, ViConstString repCapIdentifier,
                                                 ViAttr attributeId, ViInt32 value);
QN731XX_API ViStatus Qn731XX_SetAttributeViReal64(ViSession vi, ViConstString repCapIdentifier,
                                                  ViAttr attributeId, ViReal64 value);
QN731XX_API ViStatus Qn731XX_SetAttributeViBoolean(ViSession vi, ViConstString repCapIdentifier,
                                                   ViAttr attributeId, ViBoolean value);
QN731XX_API ViStatus Qn731XX_SetAttributeViString(ViSession vi, ViConstString repCapIdentifier,
                                                  ViAttr attributeId, ViConstString value);
QN731XX_API ViStatus Qn731XX_SetAttributeViSession(ViSession vi, ViConstString repCapIdentifier,
                                                   ViAttr attributeId, ViSession value);

/* Attribute shortcuts. */
QN731XX_API ViStatus Qn731XX_ActualRecordLength(ViSession vi, ViInt32 *actualRecordLength);
QN731XX_API ViStatus Qn731XX_SampleRate(ViSession vi, ViReal64 *sampleRate);
QN731XX_API ViStatus Qn731XX_SampleMode(ViSession vi, ViInt32 *sampleMode);
QN731XX_API ViStatus Qn731XX_AutoProbeSenseValue(ViSession vi, ViConstString channel,
                                                 ViReal64 *autoProbeSenseValue);
QN731XX_API ViStatus Qn731XX_ConfigureAcquisitionType(ViSession vi, ViInt32 acquisitionType);
QN731XX_API ViStatus Qn731XX_ConfigureInterpolation(ViSession vi, ViInt32 interpolation);
QN731XX_API ViStatus Qn731XX_ConfigureInitiateContinuous(ViSession vi,
                                                         ViBoolean continuousAcquisition);
QN731XX_API ViStatus Qn731XX_ConfigureTriggerCoupling(ViSession vi, ViInt32 coupling);
QN731XX_API ViStatus Qn731XX_ConfigureTriggerModifier(ViSession vi, ViInt32 triggerModifier);
QN731XX_API ViStatus Qn731XX_ConfigureTVTriggerLineNumber(ViSession vi, ViInt32 lineNumber);
QN731XX_API ViStatus Qn731XX_ConfigureAcLineTriggerSlope(ViSession vi, ViInt32 acLineSlope);
QN731XX_API ViStatus Qn731XX_ConfigureNumAverages(ViSession vi, ViInt32 numberOfAverages);
QN731XX_API ViStatus Qn731XX_ConfigureNumEnvelopes(ViSession vi, ViInt32 numberOfEnvelopes);

/* ------------------------------------------------------------------------ */
/* Inherent operations                                                       */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_reset(ViSession vi);
QN731XX_API ViStatus Qn731XX_ResetWithDefaults(ViSession vi);
QN731XX_API ViStatus Qn731XX_Disable(ViSession vi);
/* testMessage receives at most 1024 characters including the terminator. */
QN731XX_API ViStatus Qn731XX_self_test(ViSession vi, ViInt16 *testResult, ViChar testMessage[]);
/* errorMessage receives at most 1024 characters including the terminator. */
QN731XX_API ViStatus Qn731XX_error_query(ViSession vi, ViInt32 *errorCode,
                                         ViChar errorMessage[]);
/* Each buffer receives at most 256 characters including the terminator. */
QN731XX_API ViStatus Qn731XX_revision_query(ViSession vi, ViChar driverRev[],
                                            ViChar instrRev[]);
QN731XX_API ViStatus Qn731XX_InvalidateAllAttributes(ViSession vi);
QN731XX_API ViStatus Qn731XX_ResetInterchangeCheck(ViSession vi);
QN731XX_API ViStatus Qn731XX_ClearInterchangeWarnings(ViSession vi);
QN731XX_API ViStatus Qn731XX_GetNextInterchangeWarning(ViSession vi, ViInt32 bufferSize,
                                                       ViChar warning[]);
QN731XX_API ViStatus Qn731XX_GetNextCoercionRecord(ViSession vi, ViInt32 bufferSize,
                                                   ViChar record[]);

/* ------------------------------------------------------------------------ */
/* Acquisition and channels                                                  */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_ConfigureAcquisitionRecord(ViSession vi, ViReal64 timePerRecord,
                                                        ViInt32 minNumPts,
                                                        ViReal64 acquisitionStartTime);
QN731XX_API ViStatus Qn731XX_ConfigureChannel(ViSession vi, ViConstString channel,
                                              ViReal64 range, ViReal64 offset, ViInt32 coupling,
                                              ViReal64 probeAttenuation, ViBoolean enabled);
QN731XX_API ViStatus Qn731XX_ConfigureChanCharacteristics(ViSession vi, ViConstString channel,
                                                          ViReal64 inputImpedance,
                                                          ViReal64 maxInputFrequency);
/* index counts from 1. */
QN731XX_API ViStatus Qn731XX_GetChannelName(ViSession vi, ViInt32 index, ViInt32 bufferSize,
                                            ViChar name[]);
QN731XX_API ViStatus Qn731XX_ChannelClearProtection(ViSession vi, ViConstString channel);

/* ------------------------------------------------------------------------ */
/* Acquisition control and waveforms                                         */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_InitiateAcquisition(ViSession vi);
QN731XX_API ViStatus Qn731XX_Abort(ViSession vi);
QN731XX_API ViStatus Qn731XX_AcquisitionStatus(ViSession vi, ViInt32 *status);
QN731XX_API ViStatus Qn731XX_AutoSetup(ViSession vi);
QN731XX_API ViStatus Qn731XX_IsInvalidWfmElement(ViSession vi, ViReal64 elementValue,
                                                 ViBoolean *isInvalid);
/* The waveform functions write at most waveformSize (arraySize) points into
 * the caller's arrays; *actualPoints is the number of points written. */
QN731XX_API ViStatus Qn731XX_ReadWaveform(ViSession vi, ViConstString channel,
                                          ViInt32 waveformSize, ViInt32 maxTimeMilliseconds,
                                          ViReal64 waveformArray[], ViInt32 *actualPoints,
                                          ViReal64 *initialX, ViReal64 *xIncrement);
QN731XX_API ViStatus Qn731XX_FetchWaveform(ViSession vi, ViConstString channel,
                                           ViInt32 waveformSize, ViReal64 waveformArray[],
                                           ViInt32 *actualPoints, ViReal64 *initialX,
                                           ViReal64 *xIncrement);
QN731XX_API ViStatus Qn731XX_ReadMinMaxWaveform(ViSession vi, ViConstString channel,
                                                ViInt32 maxTimeMilliseconds, ViInt32 arraySize,
                                                ViReal64 minWaveform[], ViReal64 maxWaveform[],
                                                ViInt32 *actualPoints, ViReal64 *initialX,
                                                ViReal64 *xIncrement);
QN731XX_API ViStatus Qn731XX_FetchMinMaxWaveform(ViSession vi, ViConstString channel,
                                                 ViInt32 arraySize, ViReal64 minWaveform[],
                                                 ViReal64 maxWaveform[], ViInt32 *actualPoints,
                                                 ViReal64 *initialX, ViReal64 *xIncrement);
/* index counts from 1. */
QN731XX_API ViStatus Qn731XX_GetMeasurementName(ViSession vi, ViInt32 index,
                                                ViInt32 bufferSize, ViChar name[]);
/* index counts from 1. */
QN731XX_API ViStatus Qn731XX_GetDigitalChannelName(ViSession vi, ViInt32 index,
                                                   ViInt32 bufferSize, ViChar name[]);

/* ------------------------------------------------------------------------ */
/* Measurements                                                              */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_FetchWaveformMeasurement(ViSession vi, ViConstString channel,
                                                      ViInt32 measFunction, ViReal64 *measurement);
QN731XX_API ViStatus Qn731XX_ReadWaveformMeasurement(ViSession vi, ViConstString channel,
                                                     ViInt32 measFunction,
                                                     ViInt32 maxTimeMilliseconds,
                                                     ViReal64 *measurement);
/* The name of a measurement function on the measurement object named. */
QN731XX_API ViStatus Qn731XX_MeasurementFunctionName(ViSession vi, ViConstString measurement,
                                                     ViInt32 measFunction, ViInt32 bufferSize,
                                                     ViChar name[]);
QN731XX_API ViStatus Qn731XX_ConfigureRefLevels(ViSession vi, ViReal64 low, ViReal64 mid,
                                                ViReal64 high);
QN731XX_API ViStatus Qn731XX_MultiWaveformMeasurementResetActivity(ViSession vi);
QN731XX_API ViStatus Qn731XX_MultiWaveformMeasurementReadActivity(ViSession vi, ViInt32 *edges,
                                                                  ViInt32 *levels);
QN731XX_API ViStatus Qn731XX_MultiWaveformMeasurementConfigureDelay(
    ViSession vi, ViConstString source2, ViInt32 slope1, ViInt32 slope2, ViInt32 delayOccurence1,
    ViInt32 delayOccurence2);
/* Digital records are one byte per point; at most waveformSize bytes are
 * written and *actualPoints is the number written. */
QN731XX_API ViStatus Qn731XX_DigitalChannelFetchDigitalWaveform(
    ViSession vi, ViConstString digitalChannel, ViInt32 waveformSize, ViByte waveformArray[],
    ViInt32 *actualPoints, ViReal64 *initialX, ViReal64 *xIncrement);
QN731XX_API ViStatus Qn731XX_DigitalChannelReadDigitalWaveform(
    ViSession vi, ViConstString digitalChannel, ViInt32 waveformSize, ViInt32 maxTimeMilliseconds,
    ViByte waveformArray[], ViInt32 *actualPoints, ViReal64 *initialX, ViReal64 *xIncrement);

/* ------------------------------------------------------------------------ */
/* System and display                                                        */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_SystemWaitForOperationComplete(ViSession vi,
                                                            ViInt32 maxTimeMilliseconds);
QN731XX_API ViStatus Qn731XX_SystemSaveState(ViSession vi, ViConstString identifier);
QN731XX_API ViStatus Qn731XX_SystemRecallState(ViSession vi, ViConstString identifier);
QN731XX_API ViStatus Qn731XX_SystemPutState(ViSession vi, ViInt32 size, ViByte data[]);
/* At most size bytes are written; *actualSize is the number written. */
QN731XX_API ViStatus Qn731XX_SystemGetState(ViSession vi, ViInt32 size, ViByte data[],
                                            ViInt32 *actualSize);
QN731XX_API ViStatus Qn731XX_SystemGetScreenBitmap(ViSession vi, ViInt32 size, ViByte data[],
                                                   ViInt32 *actualSize);
QN731XX_API ViStatus Qn731XX_SystemEnableLocalControls(ViSession vi);
QN731XX_API ViStatus Qn731XX_SystemDisableLocalControls(ViSession vi);
/* A message written to, and a reply read from, the instrument directly. */
QN731XX_API ViStatus Qn731XX_SystemWrite(ViSession vi, ViConstString command);
QN731XX_API ViStatus Qn731XX_SystemRead(ViSession vi, ViInt32 bufferSize, ViChar buffer[]);
QN731XX_API ViStatus Qn731XX_DisplayErase(ViSession vi);

/* ------------------------------------------------------------------------ */
/* Status registers                                                          */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_StatusPreset(ViSession vi);
QN731XX_API ViStatus Qn731XX_StatusClear(ViSession vi);
QN731XX_API ViStatus Qn731XX_StatusConfigureServiceRequest(ViSession vi, ViInt32 reason);
QN731XX_API ViStatus Qn731XX_StatusGetRegister(ViSession vi, ViInt32 statusRegister,
                                               ViInt32 subRegister, ViInt32 *value);
QN731XX_API ViStatus Qn731XX_StatusSetRegister(ViSession vi, ViInt32 statusRegister,
                                               ViInt32 subRegister, ViInt32 value);

/* ------------------------------------------------------------------------ */
/* Triggers                                                                  */
/* ------------------------------------------------------------------------ */

QN731XX_API ViStatus Qn731XX_ConfigureTrigger(ViSession vi, ViInt32 triggerType, ViReal64 holdoff);
QN731XX_API ViStatus Qn731XX_ConfigureEdgeTriggerSource(ViSession vi, ViConstString source,
                                                        ViReal64 level, ViInt32 slope);
QN731XX_API ViStatus Qn731XX_ConfigureGlitchTriggerSource(ViSession vi, ViConstString source,
                                                          ViReal64 level, ViReal64 width,
                                                          ViInt32 polarity, ViInt32 condition);
QN731XX_API ViStatus Qn731XX_ConfigureRuntTriggerSource(ViSession vi, ViConstString source,
                                                        ViReal64 thresholdLow,
                                                        ViReal64 thresholdHigh, ViInt32 polarity);
QN731XX_API ViStatus Qn731XX_ConfigureTVTriggerSource(ViSession vi, ViConstString source,
                                                      ViInt32 signalFormat, ViInt32 event,
                                                      ViInt32 polarity);
QN731XX_API ViStatus Qn731XX_ConfigureWidthTriggerSource(ViSession vi, ViConstString source,
                                                         ViReal64 level, ViReal64 thresholdLow,
                                                         ViReal64 thresholdHigh, ViInt32 polarity,
                                                         ViInt32 condition);
QN731XX_API ViStatus Qn731XX_TriggerPatternConfigure(ViSession vi, ViInt32 analogPattern,
                                                     ViInt32 analogMask, ViInt32 digitalPattern,
                                                     ViInt32 digitalMask, ViInt32 matchingMode);
QN731XX_API ViStatus Qn731XX_TriggerRuntConfigure(ViSession vi, ViConstString source,
                                                  ViReal64 thresholdLow, ViReal64 thresholdHigh,
                                                  ViInt32 polarity);
QN731XX_API ViStatus Qn731XX_TriggerStateConfigure(ViSession vi, ViConstString clockSource,
                                                   ViReal64 clockLevel, ViInt32 clockSlope,
                                                   ViInt32 analogPattern, ViInt32 analogMask,
                                                   ViInt32 digitalPattern, ViInt32 digitalMask);

#ifdef __cplusplus
}
#endif

#endif /* QN731XX_H */

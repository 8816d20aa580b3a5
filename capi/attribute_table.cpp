// The attribute rows: ID constant, interface, property and scope. The lookup
// table joining each row to its property is built once.
#include "capi/attribute_table.h"

#include <array>
#include <algorithm>
#include <vector>

#include "Qn731XX.h"

namespace qn::capi {

namespace {

#define QN_ATTR(Id, Itf, Prop, Where) AttributeRow{Id, #Id, #Itf "." #Prop, Scope::Where}

constexpr auto kRows = std::to_array<AttributeRow>({
    QN_ATTR(IVI_ATTR_RANGE_CHECK, IIviDriverOperation, RangeCheck, kSession),
    QN_ATTR(IVI_ATTR_QUERY_INSTRUMENT_STATUS, IIviDriverOperation, QueryInstrumentStatus, kSession),
    QN_ATTR(IVI_ATTR_CACHE, IIviDriverOperation, Cache, kSession),
    QN_ATTR(IVI_ATTR_SIMULATE, IIviDriverOperation, Simulate, kSession),
    QN_ATTR(IVI_ATTR_RECORD_COERCIONS, IIviDriverOperation, RecordCoercions, kSession),
    QN_ATTR(IVI_ATTR_DRIVER_SETUP, IIviDriverOperation, DriverSetup, kSession),
    QN_ATTR(IVI_ATTR_INTERCHANGE_CHECK, IIviDriverOperation, InterchangeCheck, kSession),
    QN_ATTR(IVI_ATTR_CHANNEL_COUNT, IIviScopeChannels, Count, kSession),
    QN_ATTR(IVI_ATTR_IO_RESOURCE_DESCRIPTOR, IIviDriverOperation, IoResourceDescriptor, kSession),
    QN_ATTR(IVI_ATTR_LOGICAL_NAME, IIviDriverOperation, LogicalName, kSession),
    QN_ATTR(IVI_ATTR_SUPPORTED_INSTRUMENT_MODELS, IIviDriverIdentity, SupportedInstrumentModels, kSession),
    QN_ATTR(IVI_ATTR_GROUP_CAPABILITIES, IIviDriverIdentity, GroupCapabilities, kSession),
    QN_ATTR(IVI_ATTR_INSTRUMENT_FIRMWARE_REVISION, IIviDriverIdentity, InstrumentFirmwareRevision, kSession),
    QN_ATTR(IVI_ATTR_INSTRUMENT_MANUFACTURER, IIviDriverIdentity, InstrumentManufacturer, kSession),
    QN_ATTR(IVI_ATTR_INSTRUMENT_MODEL, IIviDriverIdentity, InstrumentModel, kSession),
    QN_ATTR(IVI_ATTR_SPECIFIC_DRIVER_VENDOR, IIviComponentIdentity, Vendor, kSession),
    QN_ATTR(IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION, IIviComponentIdentity, Description, kSession),
    QN_ATTR(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION, IIviDriverIdentity, SpecificationMajorVersion, kSession),
    QN_ATTR(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION, IIviDriverIdentity, SpecificationMinorVersion, kSession),
    QN_ATTR(IVI_ATTR_SPECIFIC_DRIVER_REVISION, IIviComponentIdentity, Revision, kSession),

    QN_ATTR(IVISCOPE_ATTR_VERTICAL_RANGE, IIviScopeChannel, Range, kChannel),
    QN_ATTR(IVISCOPE_ATTR_VERTICAL_OFFSET, IIviScopeChannel, Offset, kChannel),
    QN_ATTR(IVISCOPE_ATTR_VERTICAL_COUPLING, IIviScopeChannel, Coupling, kChannel),
    QN_ATTR(IVISCOPE_ATTR_PROBE_ATTENUATION, IIviScopeChannel, ProbeAttenuation, kChannel),
    QN_ATTR(IVISCOPE_ATTR_CHANNEL_ENABLED, IIviScopeChannel, Enabled, kChannel),
    QN_ATTR(IVISCOPE_ATTR_MAX_INPUT_FREQUENCY, IIviScopeChannel, InputFrequencyMax, kChannel),
    QN_ATTR(IVISCOPE_ATTR_HORZ_TIME_PER_RECORD, IIviScopeAcquisition, TimePerRecord, kSession),
    QN_ATTR(IVISCOPE_ATTR_HORZ_RECORD_LENGTH, IIviScopeAcquisition, RecordLength, kSession),
    QN_ATTR(IVISCOPE_ATTR_HORZ_MIN_NUM_PTS, IIviScopeAcquisition, NumberOfPointsMin, kSession),
    QN_ATTR(IVISCOPE_ATTR_HORZ_SAMPLE_RATE, IIviScopeAcquisition, SampleRate, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_TYPE, IIviScopeTrigger, Type, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_SOURCE, IIviScopeTrigger, Source, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_COUPLING, IIviScopeTrigger, Coupling, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_HOLDOFF, IIviScopeTrigger, Holdoff, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_LEVEL, IIviScopeTrigger, Level, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_SLOPE, IIviScopeTriggerEdge, Slope, kSession),
    QN_ATTR(IVISCOPE_ATTR_INTERPOLATION, IIviScopeAcquisition, Interpolation, kSession),
    QN_ATTR(IVISCOPE_ATTR_ACQUISITION_TYPE, IIviScopeAcquisition, Type, kSession),
    QN_ATTR(IVISCOPE_ATTR_TRIGGER_MODIFIER, IIviScopeTrigger, Modifier, kSession),
    QN_ATTR(IVISCOPE_ATTR_INPUT_IMPEDANCE, IIviScopeChannel, InputImpedance, kChannel),
    QN_ATTR(IVISCOPE_ATTR_NUM_AVERAGES, IIviScopeAcquisition, NumberOfAverages, kSession),
    QN_ATTR(IVISCOPE_ATTR_NUM_ENVELOPES, IIviScopeAcquisition, NumberOfEnvelopes, kSession),
    QN_ATTR(IVISCOPE_ATTR_SAMPLE_MODE, IIviScopeAcquisition, SampleMode, kSession),
    QN_ATTR(IVISCOPE_ATTR_INITIATE_CONTINUOUS, IIviScopeTrigger, Continuous, kSession),
    QN_ATTR(IVISCOPE_ATTR_PROBE_SENSE_VALUE, IIviScopeChannel, ProbeSense, kChannel),
    QN_ATTR(IVISCOPE_ATTR_ACQUISITION_START_TIME, IIviScopeAcquisition, StartTime, kSession),
    QN_ATTR(IVISCOPE_ATTR_TV_TRIGGER_SIGNAL_FORMAT, IIviScopeTriggerTv, SignalFormat, kSession),
    QN_ATTR(IVISCOPE_ATTR_TV_TRIGGER_POLARITY, IIviScopeTriggerTv, polarity, kSession),
    QN_ATTR(IVISCOPE_ATTR_TV_TRIGGER_EVENT, IIviScopeTriggerTv, Event, kSession),
    QN_ATTR(IVISCOPE_ATTR_TV_TRIGGER_LINE_NUMBER, IIviScopeTriggerTv, LineNumber, kSession),
    QN_ATTR(IVISCOPE_ATTR_RUNT_HIGH_THRESHOLD, IIviScopeTriggerRunt, ThresholdHigh, kSession),
    QN_ATTR(IVISCOPE_ATTR_RUNT_LOW_THRESHOLD, IIviScopeTriggerRunt, ThresholdLow, kSession),
    QN_ATTR(IVISCOPE_ATTR_RUNT_POLARITY, IIviScopeTriggerRunt, polarity, kSession),
    QN_ATTR(IVISCOPE_ATTR_GLITCH_WIDTH, IIviScopeTriggerGlitch, Width, kSession),
    QN_ATTR(IVISCOPE_ATTR_GLITCH_POLARITY, IIviScopeTriggerGlitch, polarity, kSession),
    QN_ATTR(IVISCOPE_ATTR_GLITCH_CONDITION, IIviScopeTriggerGlitch, condition, kSession),
    QN_ATTR(IVISCOPE_ATTR_WIDTH_LOW_THRESHOLD, IIviScopeTriggerWidth, ThresholdLow, kSession),
    QN_ATTR(IVISCOPE_ATTR_WIDTH_HIGH_THRESHOLD, IIviScopeTriggerWidth, ThresholdHigh, kSession),
    QN_ATTR(IVISCOPE_ATTR_WIDTH_POLARITY, IIviScopeTriggerWidth, polarity, kSession),
    QN_ATTR(IVISCOPE_ATTR_WIDTH_CONDITION, IIviScopeTriggerWidth, condition, kSession),
    QN_ATTR(IVISCOPE_ATTR_MEAS_HIGH_REF, IIviScopeReferenceLevel, High, kSession),
    QN_ATTR(IVISCOPE_ATTR_MEAS_LOW_REF, IIviScopeReferenceLevel, Low, kSession),
    QN_ATTR(IVISCOPE_ATTR_MEAS_MID_REF, IIviScopeReferenceLevel, Mid, kSession),
    QN_ATTR(IVISCOPE_ATTR_AC_LINE_TRIGGER_SLOPE, IIviScopeTriggerAcLine, Slope, kSession),

    QN_ATTR(QN731XX_ATTR_CHANNEL_LABEL, IQuorlen731XXChannel, Label, kUserChannel),
    QN_ATTR(QN731XX_ATTR_CHANNEL_INVERT, IQuorlen731XXChannel, Invert, kUserChannel),
    QN_ATTR(QN731XX_ATTR_CHANNEL_PROBE_SKEW, IQuorlen731XXChannel, ProbeSkew, kUserChannel),
    QN_ATTR(QN731XX_ATTR_CHANNEL_PROTECTION, IQuorlen731XXChannel, Protection, kUserChannel),
    QN_ATTR(QN731XX_ATTR_CHANNEL_UNITS, IQuorlen731XXChannel, Units, kUserChannel),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_EDGE_OCCURRENCE, IQuorlen731XXConfigurableMeasurement, TimeAtEdgeOccurrence, kSession),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_EDGE_SLOPE, IQuorlen731XXConfigurableMeasurement, TimeAtEdgeSlope, kSession),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_OCCURRENCE, IQuorlen731XXConfigurableMeasurement, TimeAtValueOccurrence, kSession),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_SLOPE, IQuorlen731XXConfigurableMeasurement, TimeAtValueSlope, kSession),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_TIME_AT_VALUE_VALUE, IQuorlen731XXConfigurableMeasurement, TimeAtValueValue, kSession),
    QN_ATTR(QN731XX_ATTR_CONFIGURABLEMEASUREMENT_VALUE_AT_TIME_TIME, IQuorlen731XXConfigurableMeasurement, ValueAtTimeTime, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_ENABLED, IQuorlen731XXCursors, Enabled, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_X1_POSITION, IQuorlen731XXCursors, X1Position, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_X1Y1_SOURCE, IQuorlen731XXCursors, X1Y1Source, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_X2_POSITION, IQuorlen731XXCursors, X2Position, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_X2Y2_SOURCE, IQuorlen731XXCursors, X2Y2Source, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_Y1_POSITION, IQuorlen731XXCursors, Y1Position, kSession),
    QN_ATTR(QN731XX_ATTR_CURSORS_Y2_POSITION, IQuorlen731XXCursors, Y2Position, kSession),
    QN_ATTR(QN731XX_ATTR_DIGITALCHANNEL_ENABLED, IQuorlen731XXDigitalChannel, Enabled, kDigitalChannel),
    QN_ATTR(QN731XX_ATTR_DIGITALCHANNEL_LABEL, IQuorlen731XXDigitalChannel, Label, kDigitalChannel),
    QN_ATTR(QN731XX_ATTR_DIGITALCHANNEL_THRESHOLD, IQuorlen731XXDigitalChannel, Threshold, kDigitalChannel),
    QN_ATTR(QN731XX_ATTR_DISPLAY_LABEL_ENABLED, IQuorlen731XXDisplay, LabelEnabled, kSession),
    QN_ATTR(QN731XX_ATTR_DISPLAY_PERSISTENCE, IQuorlen731XXDisplay, Persistence, kSession),
    QN_ATTR(QN731XX_ATTR_EXTERNAL_PROBE_ATTENUATION, IQuorlen731XXExternal, ProbeAttenuation, kSession),
    QN_ATTR(QN731XX_ATTR_EXTERNAL_PROBE_SENSE, IQuorlen731XXExternal, ProbeSense, kSession),
    QN_ATTR(QN731XX_ATTR_EXTERNAL_UNITS, IQuorlen731XXExternal, Units, kSession),
    QN_ATTR(QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_OCCURENCE1, IQuorlen731XXMultiWaveformMeasurement, DelayOccurence1, kSession),
    QN_ATTR(QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_OCCURENCE2, IQuorlen731XXMultiWaveformMeasurement, DelayOccurence2, kSession),
    QN_ATTR(QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_SLOPE1, IQuorlen731XXMultiWaveformMeasurement, DelaySlope1, kSession),
    QN_ATTR(QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_DELAY_SLOPE2, IQuorlen731XXMultiWaveformMeasurement, DelaySlope2, kSession),
    QN_ATTR(QN731XX_ATTR_MULTIWAVEFORMMEASUREMENT_SOURCE2, IQuorlen731XXMultiWaveformMeasurement, Source2, kSession),
    QN_ATTR(QN731XX_ATTR_STATUS_SERIAL_POLL, IQuorlen731XXStatus, SerialPoll, kSession),
    QN_ATTR(QN731XX_ATTR_SYSTEM_DATE, IQuorlen731XXSystem, Date, kSession),
    QN_ATTR(QN731XX_ATTR_SYSTEM_SERIAL_NUMBER, IQuorlen731XXSystem, SerialNumber, kSession),
    QN_ATTR(QN731XX_ATTR_SYSTEM_TIME, IQuorlen731XXSystem, Time, kSession),
    QN_ATTR(QN731XX_ATTR_SYSTEM_TIMEOUT_MILLISECONDS, IQuorlen731XXSystem, TimeoutMilliseconds, kSession),
    QN_ATTR(QN731XX_ATTR_SYSTEM_TRACE_ENABLED, IQuorlen731XXSystem, TraceEnabled, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_RUNT_POLARITY, IQuorlen731XXTriggerRunt, polarity, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_RUNT_THRESHOLD_HIGH, IQuorlen731XXTriggerRunt, ThresholdHigh, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_RUNT_THRESHOLD_LOW, IQuorlen731XXTriggerRunt, ThresholdLow, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_TV_EVENT, IQuorlen731XXTriggerTv, Event, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_ANALOG_MASK, IQuorlen731XXTriggerState, AnalogMask, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_ANALOG_PATTERN, IQuorlen731XXTriggerState, AnalogPattern, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_CLOCK_SLOPE, IQuorlen731XXTriggerState, ClockSlope, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_CLOCK_SOURCE, IQuorlen731XXTriggerState, ClockSource, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_DIGITAL_MASK, IQuorlen731XXTriggerState, DigitalMask, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_STATE_DIGITAL_PATTERN, IQuorlen731XXTriggerState, DigitalPattern, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_PATTERN_ANALOG_MASK, IQuorlen731XXTriggerPattern, AnalogMask, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_PATTERN_ANALOG_PATTERN, IQuorlen731XXTriggerPattern, AnalogPattern, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_PATTERN_CONDITION, IQuorlen731XXTriggerPattern, condition, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_PATTERN_DIGITAL_MASK, IQuorlen731XXTriggerPattern, DigitalMask, kSession),
    QN_ATTR(QN731XX_ATTR_TRIGGER_PATTERN_DIGITAL_PATTERN, IQuorlen731XXTriggerPattern, DigitalPattern, kSession),
    QN_ATTR(QN731XX_ATTR_MEASUREMENT_COUNT, IQuorlen731XXMeasurements, Count, kSession),
    QN_ATTR(QN731XX_ATTR_DIGITALCHANNEL_COUNT, IQuorlen731XXDigitalChannels, Count, kSession),
});

}  // namespace

std::span<const AttributeRow> AttributeRows() { return kRows; }

namespace {

// An open-addressed table keyed by ID: every attribute call looks its ID up,
// so the lookup is one multiply and, as a rule, one probe.
struct Lookup {
    static constexpr unsigned kBits = 10;
    static constexpr std::size_t kSlots = std::size_t{1} << kBits;
    static_assert(std::size(kRows) * 2 <= kSlots, "the table stays at most half full");
    ViAttr ids[kSlots] = {};  // 0: a free slot (no attribute has ID 0)
    Attribute attributes[kSlots];
    std::size_t interfaces = 0;

    static std::size_t Home(ViAttr id) { return (id * 2654435761u) >> (32 - kBits); }
    std::size_t SlotOf(ViAttr id) const {
        std::size_t i = Home(id);
        while (ids[i] != 0 && ids[i] != id) i = (i + 1) & (kSlots - 1);
        return i;
    }
};

const Lookup& Table() {
    static const Lookup lookup = [] {
        Lookup l;
        std::vector<const IID*> seen;
        for (const AttributeRow& row : kRows) {
            Attribute a{&row, FindProperty(row.key), 0};
            if (a.property) {
                auto it = std::find_if(seen.begin(), seen.end(),
                                       [&](const IID* iid) { return *iid == *a.property->iid; });
                a.interface_slot = static_cast<std::size_t>(it - seen.begin());
                if (it == seen.end()) seen.push_back(a.property->iid);
            }
            const std::size_t slot = l.SlotOf(row.id);
            l.ids[slot] = row.id;
            l.attributes[slot] = a;
        }
        l.interfaces = seen.size();
        return l;
    }();
    return lookup;
}

}  // namespace

Attribute FindAttribute(ViAttr id) {
    if (id == 0) return {};
    const Lookup& l = Table();
    const std::size_t slot = l.SlotOf(id);
    return l.ids[slot] == id ? l.attributes[slot] : Attribute{};
}

std::size_t AttributeInterfaceCount() { return Table().interfaces; }

}  // namespace qn::capi

# Cause and criticality diagnostics. A cause says why a procedure failed,
# criticality diagnostics say where a message was rejected. The Cause_Level_
# forms carry either a general cause or a list of causes per radio link.

# ---------------------------------------------------------------- cause

values CauseType { 0 "radioNetwork" 1 "transport" 2 "protocol" 3 "misc" }

values CauseRadioNetwork {
  0 "unknown_C_ID"
  1 "cell_not_available"
  2 "power_level_not_supported"
  3 "ul_scrambling_code_already_in_use"
  4 "dl_radio_resources_not_available"
  5 "ul_radio_resources_not_available"
  6 "rl_already_ActivatedOrAlocated"
  7 "nodeB_Resources_unavailable"
  8 "insufficient_physical_channel_resources"
  9 "measurement_not_supported_for_the_object"
  10 "combining_resources_not_avalilable"
  11 "reconfiguration_not_allowed"
  12 "requested_configuration_not_supported"
  13 "synchronisation_failure"
  14 "no_closed_loop_timing_adjustment_mode_configured"
  15 "unspecified"
  16 "cRNC_Communication_Context_ID_already_allocated"
  17 "dl_channelisation_code_already_allocated"
  18 "dRNC_resources_unavailable"
}

values CauseRadioNetworkExt {
  0 "restricted_by_DL_radio_resources"
  1 "limited_by_DL_radio_resources"
  2 "restricted_by_DL_channelisation_code"
  3 "limited_by_DL_channelisation_code"
}

values CauseTransport {
  0 "transport_link_failure"
  1 "transmission_port_not_available"
  2 "transport_resource_unavailable"
  3 "unspecified"
}

values CauseProtocol {
  0 "transaction_not_allowed"
  1 "transfer_syntax_error"
  2 "abstract_syntax_error_reject"
  3 "abstract_syntax_error_ignore_and_notify"
  4 "message_not_compatible_with_receiver_state"
  5 "semantic_error"
  6 "unspecified"
}

values CauseMisc {
  0 "control_processing_overload"
  1 "hardware_failure"
  2 "om_intervention"
  3 "not_enough_user_plane_processing_resources"
  4 "unspecified"
}

values CauseMiscExt {
  0 "nodeB_processing_overload"
  1 "restricted_by_user_plane_processing_resources"
  2 "limited_by_user_plane_processing_resources"
  3 "unavailable_extension_group_id"
}

# Two extension levels: the group choice has its own extension bit, and so
# has each group. Behind the second bit the radio network and misc groups
# read an extended value, the transport and protocol groups nothing. A cause
# takes 1 to 11 bits and is never aligned.
rule Cause ie 11 {
  field 2661 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2664 2 "  Cause TYPE" values CauseType keep Type key
    if Type == 0 {
      call CauseRadioNetwork
    }
    if Type == 1 {
      call CauseTransport
    }
    if Type == 2 {
      call CauseProtocol
    }
    if Type == 3 {
      call CauseMisc
    }
  }
}

rule CauseRadioNetwork {
  field 2678 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2681 5 "  CauseRadioNetwork" values CauseRadioNetwork key
  }
  if Ext == 1 {
    field 2683 7 "  CauseRadioNetworkExt" values CauseRadioNetworkExt key
  }
}

rule CauseTransport {
  field 2684 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2687 2 "  CauseTransport" values CauseTransport key
  }
}

rule CauseProtocol {
  field 2673 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2676 3 "  CauseProtocol" values CauseProtocol key
  }
}

rule CauseMisc {
  field 2667 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2670 4 "  CauseMisc" values CauseMisc key
  }
  if Ext == 1 {
    field 2672 7 "  CauseMiscExt" values CauseMiscExt key
  }
}

# ------------------------------------------------------ cause levels

# The general arm is a whole IE container, the radio link arm a container
# list; the causes themselves stand in IEs of those containers.
values CauseLevel { 0 "general" 1 "rL_Specific" }

rule Cause_Level_RL_ReconfFail ie 203 {
  field 1994 1 "  Cause_Level_RL_ReconfFail Index" values CauseLevel keep Index
  if Index == 0 {
    call Cause_RL_ReconfFail
  }
  if Index == 1 {
    call RL_ReconfigurationFailure_RL_ReconfFail
  }
}

rule Cause_RL_ReconfFail {
  call protocolIEs
}

rule RL_ReconfigurationFailure_RL_ReconfFail ie 141 {
  call ContainerList3358
}

rule Cause_Level_CompressedModeFail ie 201 {
  field 2548 1 "  Cause_Level_CompressedModeFail Index" values CauseLevel keep Index
  if Index == 0 {
    call Cause_CompressedModeFail
  }
  if Index == 1 {
    call RL_ReconfigurationFailureItem_CompressedModeFail
  }
}

rule Cause_CompressedModeFail {
  call protocolIEs
}

rule RL_ReconfigurationFailureItem_CompressedModeFail {
  call ContainerList3358
}

# The IE of those containers: a radio link and its cause, with no extension
# bit and no presence bit.
rule RL_ReconfigurationFailure_CompressedModeFail ie 202 {
  call RL_ID_Numbered
  call Cause
}

# ------------------------------------------------ criticality diagnostics

# The IE list is read in every diagnostics, whatever the presence bits say.
rule CriticalityDiagnostics ie 20 {
  field 2716 1 "  Extension Ext" values ExtensionFlag
  field 2718 1 "  procedureCode OPTIONAL" presence
  field 2720 1 "  triggeringMessage OPTIONAL" presence
  field 2722 1 "  criticalityResponse OPTIONAL" presence
  field 2724 1 "  transactionID OPTIONAL" presence
  field 2726 1 "  iE_Extensions OPTIONAL" presence
  when "  procedureCode OPTIONAL" call ProcedureCode
  when "  triggeringMessage OPTIONAL" call TriggeringMessage
  when "  criticalityResponse OPTIONAL" call Criticality
  when "  transactionID OPTIONAL" call CriticalityDiagnostics_TransactionID
  call CriticalityDiagnostics_IE_List
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The procedure code as a plain number, without the names of the frame's.
rule ProcedureCode {
  align
  field 3276 8 "  ProcedureCode"
}

rule TriggeringMessage {
  field 3283 2 "  TriggeringMessage" values {
    0 "initiating_message"
    1 "successful_outcome"
    2 "unsuccessfull_outcome"
    3 "outcome"
  }
}

# The transaction id of the diagnostics; it shares no field with the one of
# the message frame.
rule CriticalityDiagnostics_TransactionID "TransactionID" {
  field 3279 1 "  TransactionID Index" values TransactionIdType keep Index
  if Index == 0 {
    call TransactionID_shortTransActionId
  }
  if Index == 1 {
    call TransactionID_longTransActionId
  }
}

rule TransactionID_shortTransActionId {
  field 3281 7 "  TransactionID_shortTransActionId"
}

rule TransactionID_longTransActionId {
  align
  field 3282 16 "  TransactionID_longTransActionId"
}

# One to 256 items: the length field keeps its raw value, the loop runs one
# more time.
rule CriticalityDiagnostics_IE_List {
  align
  field 2733 8 "  CriticalityDiagnostics_IE_List Length" count Items
  repeat Items { call CriticalityDiagnostics_IE_List_list }
}

rule CriticalityDiagnostics_IE_List_list {
  field 3288 1 "  Extension Ext" values ExtensionFlag
  field 3290 1 "  repetitionNumber OPTIONAL" presence
  field 3292 1 "  iE_Extensions OPTIONAL" presence
  call Criticality
  call ProtocolIE_ID
  when "  repetitionNumber OPTIONAL" call RepetitionNumber
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The id of the IE in question, as a number: it is neither named nor
# dispatched on.
rule ProtocolIE_ID {
  align
  field 3278 16 "  ProtocolIE_ID"
}

rule RepetitionNumber {
  align
  field 3041 8 "  RepetitionNumber"
}

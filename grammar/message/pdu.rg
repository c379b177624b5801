# The PDU frame: the message header, the IE list in its public or private
# form, and the message's own extension list.

values PduType { 0 "InitiatingMessage" 1 "SuccessfulOutcome" 2 "UnsuccessfulOutcome" 3 "Outcome" }

values ProcedureCode {
  0 "id_commonTransportChannelResourcesInitiationFDD"
  1 "id_commonTransportChannelResourcesInitiationTDD"
  2 "id_commonTransportChannelResourcesRelease"
  3 "id_compressedModeCancellationFDD"
  4 "id_compressedModeCommitFDD"
  5 "id_compressedModePrepareFDD"
  6 "id_downlinkPowerControl"
  7 "id_downlinkSignallingTransfer"
  8 "id_errorIndication"
  9 "id_measurementFailure"
  10 "id_measurementInitiation"
  11 "id_measurementReporting"
  12 "id_measurementTermination"
  13 "id_pagingRequest"
  14 "id_physicalChannelReconfiguration"
  15 "id_privateMessage"
  16 "id_radioLinkAddition"
  17 "id_radioLinkDeletion"
  18 "id_radioLinkFailure"
  19 "id_radioLinkRestoration"
  20 "id_radioLinkSetup"
  21 "id_srnsRelocationCommit"
  22 "id_synchronisedRadioLinkReconfigurationCancellation"
  23 "id_synchronisedRadioLinkReconfigurationCommit"
  24 "id_synchronisedRadioLinkReconfigurationPrepare"
  25 "id_unSynchronisedRadioLinkReconfiguration"
  26 "id_uplinkSignallingTransfer"
}

# The message names the Display pass shows for a procedure code, by the PDU
# type under which the code stands.
values InitiatingMessageNames {
  other "Unknown"
  0 "CommonTransportChannelResourcesRequest"
  1 "CommonTransportChannelResourcesRequest"
  2 "CommonTransportChannelResourcesReleaseRequest"
  3 "CompressedModeCancel"
  4 "CompressedModeCommit"
  5 "CompressedModePrepare"
  6 "DL-PowerControlRequest"
  7 "DownlinkSignallingTransferRequest"
  8 "ErrorIndication"
  9 "DedicatedMeasurementFailureIndication"
  10 "DedicatedMeasurementInitiationRequest"
  11 "DedicatedMeasurementReport"
  12 "DedicatedMeasurementTerminationRequest"
  13 "PagingRequest"
  14 "PhysicalChannelReconfigurationRequest"
  15 "PrivateMessage"
  16 "RadioLinkAdditionRequest"
  17 "RadioLinkDeletionRequest"
  18 "RadioLinkFailureIndication"
  19 "RadioLinkRestoreIndication"
  20 "RadioLinkSetupRequest"
  21 "RelocationCommit"
  22 "RadioLinkReconfigurationCancel"
  23 "RadioLinkReconfigurationCommit"
  24 "RadioLinkReconfigurationPrepare"
  25 "RadioLinkReconfigurationRequest"
  26 "UplinkSignallingTransferIndication"
}

values SuccessfulOutcomeNames {
  other "Unknown"
  0 "CommonTransportChannelResourcesResponseFDD"
  1 "CommonTransportChannelResourcesResponseTDD"
  5 "CompressedModeReady"
  8 "DedicatedMeasurementInitiationResponse"
  10 "DedicatedMeasurementInitiationRequest"
  12 "PhysicalChannelReconfigurationCommand"
  14 "PhysicalChannelReconfigurationCommand"
  16 "RadioLinkAdditionResponse"
  17 "RadioLinkDeletionResponse"
  19 "RadioLinkSetupResponse"
  20 "RadioLinkSetupResponse"
  24 "RadioLinkReconfigurationReady"
  25 "RadioLinkReconfigurationResponse"
}

values UnsuccessfulOutcomeNames {
  other "Unknown"
  0 "CommonTransportChannelResourcesFailure"
  1 "CommonTransportChannelResourcesFailure"
  5 "CompressedModeFailure"
  8 "DedicatedMeasurementInitiationFailure"
  10 "DedicatedMeasurementInitiationRequest"
  12 "PhysicalChannelReconfigurationFailure"
  14 "PhysicalChannelReconfigurationCommand"
  16 "RadioLinkAdditionFailure"
  17 "Unknown"
  19 "RadioLinkSetupFailure"
  20 "RadioLinkSetupFailure"
  24 "RadioLinkReconfigurationFailure"
  25 "RadioLinkReconfigurationFailure"
}

values TransactionIdType { 0 "shortTransActionId" 1 "longTransActionId" }

# The message: header, IE list, extension list. Procedure 15 takes the
# private IE form and carries no extensions of its own.
rule RNSAP_PDU {
  field 684 1 "PDU EXTENSION" show "%x"
  field 685 2 "PDU Type" values PduType keep Type key
  align
  field 688 8 "Procedure Code" values ProcedureCode displayvalues InitiatingMessageNames keep Procedure key if Type == 0
  field 692 8 "Procedure Code" values ProcedureCode displayvalues SuccessfulOutcomeNames keep Procedure key if Type == 1
  field 696 8 "Procedure Code" values ProcedureCode displayvalues UnsuccessfulOutcomeNames keep Procedure key if Type == 2
  field 697 2 "ddMode" values { 0 "tdd" 1 "fdd" 2 "common" } key
  field 698 2 "Criticality" values Criticality key
  call TransactionID
  align
  field 699 1 "Message SIZE Type" keep $LengthForm
  field 702 7 "Message SIZE" if $LengthForm == 0
  if $LengthForm == 1 {
    field 704 1 "Message SIZE Type2"
    field 705 14 "Message SIZE"
  }
  field 706 1 "Message EXTENSION" show "%x"
  field 709 1 "protocolExtensions OPTIONAL" values ExtensionFlag keep ExtensionSwitch if Procedure != 15
  align
  field 710 16 "Number Of IEs" keep $MessageIeCount if Procedure != 15
  field 712 16 "  Number Of IEs" length $MessageIeCount if Procedure == 15
  if Procedure == 15 {
    repeat $MessageIeCount { call RNSAP_IE_Private }
  } else {
    repeat $MessageIeCount { call RNSAP_IE }
  }
  if ExtensionSwitch == 1 {
    align
    field 720 16 "Number Of Extensions" length ExtensionCount
    repeat ExtensionCount { call RNSAP_EXTENSIONS }
  }
}

rule TransactionID {
  field 746 1 "TransactionID TYPE" values TransactionIdType keep Type
  field 749 7 "ShortTransActionId" key if Type == 0
  if Type == 1 {
    align
    field 751 16 "LongTransActionId" key
  }
}

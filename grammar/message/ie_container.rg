# The protocol IE container: the frame of one IE, the dispatch on its id,
# the protocolIEs container and the container lists.

values Criticality { 0 "Reject" 1 "Ignore" 2 "Notify" }

values IeIds {
  0 "id_AllRLItem_DM_Rprt"
  1 "id_AllRLItem_DM_Rsp"
  2 "id_AllRL_SetItem_DM_Rprt"
  3 "id_AllRL_SetItem_DM_Rsp"
  4 "id_AllowedQueuingTime"
  5 "id_BindingID"
  6 "id_C_ID"
  7 "id_C_RNTI"
  8 "id_CFN"
  9 "id_CN_CS_DomainIdentifier"
  10 "id_CN_PS_DomainIdentifier"
  11 "id_Cause"
  12 "id_CellItem_PagingRqst"
  13 "id_CM_PatternInformationItem_CompressedModePrep"
  14 "id_CM_PatternInformationList_CompressedModePrep"
  15 "id_CombiningItem_RL_AdditionFailureFDD"
  16 "id_CombiningItem_RL_AdditionRspFDD"
  17 "id_CombiningItem_RL_AdditionRspTDD"
  18 "id_CombiningItem_RL_SetupFailureFDD"
  19 "id_CombiningItem_RL_SetupRspFDD"
  20 "id_CriticalityDiagnostics"
  21 "id_D_RNTI"
  22 "id_D_RNTI_ReleaseIndication"
  23 "id_DCH_AddListIE_RL_ReconfReadyFDD"
  24 "id_DCH_AddListIE_RL_ReconfReadyTDD"
  25 "id_DCH_AddListIE_RL_ReconfRsp"
  26 "id_DCH_AddList_RL_ReconfPrepFDD"
  27 "id_DCH_AddList_RL_ReconfPrepTDD"
  28 "id_DCH_AddList_RL_ReconfRqstFDD"
  29 "id_DCH_AddList_RL_ReconfRqstTDD"
  30 "id_DCH_DeleteList_RL_ReconfPrepFDD"
  31 "id_DCH_DeleteList_RL_ReconfPrepTDD"
  32 "id_DCH_DeleteList_RL_ReconfRqstFDD"
  33 "id_DCH_DeleteList_RL_ReconfRqstTDD"
  34 "id_DCH_Information_RL_SetupRqstFDD"
  35 "id_DCH_InformationList_RL_SetupRqstTDD"
  36 "id_DCH_ModifyListIE_RL_ReconfReadyFDD"
  37 "id_DCH_ModifyListIE_RL_ReconfReadyTDD"
  38 "id_DCH_ModifyListIE_RL_ReconfRsp"
  39 "id_DCH_ModifyList_RL_ReconfPrepFDD"
  40 "id_DCH_ModifyList_RL_ReconfPrepTDD"
  41 "id_DCH_ModifyList_RL_ReconfRqstFDD"
  42 "id_DCH_ModifyList_RL_ReconfRqstTDD"
  43 "id_DCH_InformationResponseListIE_RL_SetupRspTDD"
  44 "id_DL_CCTrCH_InformationItem_RL_ReconfPrepTDD"
  45 "id_DL_CCTrCH_InformationListIE_RL_ReconfReadyTDD"
  46 "id_DL_CCTrCH_InformationItem_RL_ReconfRqstTDD"
  47 "id_DL_CCTrCH_InformationItem_RL_SetupRqstTDD"
  48 "id_DL_CCTrCH_InformationListIE_PhyChReconfRqstTDD"
  49 "id_DL_CCTrCH_InformationListIE_RL_AdditionRspTDD"
  50 "id_DL_CCTrCH_InformationListIE_RL_SetupRspTDD"
  51 "id_DL_CCTrCH_InformationList_RL_ReconfPrepTDD"
  52 "id_DL_CCTrCH_InformationList_RL_ReconfRqstTDD"
  53 "id_DL_CCTrCH_InformationList_RL_SetupRqstTDD"
  54 "id_DL_CodeInformationListIE_PhyChReconfRqstFDD"
  55 "id_DL_CodeInformationListIE_RL_AdditionFailureFDD"
  56 "id_DL_CodeInformationListIE_RL_AdditionRspFDD"
  57 "id_DL_CodeInformationListIE_RL_ReconfReadyFDD"
  58 "id_DL_CodeInformationListIE_RL_SetupFailureFDD"
  59 "id_DL_DPCH_Information_RL_ReconfPrepFDD"
  60 "id_DL_DPCH_Information_RL_SetupRqstFDD"
  61 "id_DL_DPCH_Information_RL_ReconfRqstFDD"
  62 "id_DL_DPCH_InformationItem_PhyChReconfRqstTDD"
  63 "id_DL_DPCH_InformationItem_RL_AdditionRspTDD"
  64 "id_DL_DPCH_InformationItem_RL_SetupRspTDD"
  65 "id_DL_DPCH_InformationListIE_RL_ReconfReadyTDD"
  66 "id_DL_SIRTarget"
  67 "id_DLReferencePower"
  68 "id_DLReferencePowerList_DL_PC_Rqst"
  69 "id_DL_ReferencePowerInformation_DL_PC_Rqst"
  70 "id_DRXCycleLengthCoefficient"
  71 "id_DedicatedMeasurementObjectType_DM_Rprt"
  72 "id_DedicatedMeasurementObjectType_DM_Rqst"
  73 "id_DedicatedMeasurementObjectType_DM_Rsp"
  74 "id_DedicatedMeasurementType"
  75 "id_DiversityIndicationItem_RL_AdditionFailureFDD"
  76 "id_DiversityIndicationItem_RL_AdditionRspFDD"
  77 "id_DiversityIndicationItem_RL_AdditionRspTDD"
  78 "id_DiversityIndicationItem_RL_SetupFailureFDD"
  79 "id_DiversityIndicationItem_RL_SetupRspFDD"
  80 "id_FACH_InfoForOptionalS_CCPCH_CTCH_ResourceRspFDD"
  81 "id_FACH_InfoForOptionalS_CCPCH_CTCH_ResourceRspTDD"
  82 "id_FACH_InfoForS_CCPCH_CoupledToPRACHorPCPCH_CTCH_ResourceRspFDD"
  83 "id_FACH_InfoForS_CCPCH_CoupledToPRACH_CTCH_ResourceRspTDD"
  84 "id_IMSI"
  85 "id_L3_Information"
  86 "id_MAC_c_SDU_LengthListIE_CTCH_ResourceRspFDD"
  87 "id_MAC_c_SDU_LengthListIE_CTCH_ResourceRspTDD"
  88 "id_MAC_c_SDU_LengthListIE_option_CTCH_ResourceRspFDD"
  89 "id_MAC_c_SDU_LengthListIE_option_CTCH_ResourceRspTDD"
  90 "id_MaxAdjustmentPeriod"
  91 "id_MaxAdjustmentStep"
  92 "id_MeasurementFilterCoefficient"
  93 "id_MeasurementID"
  94 "id_MultipleURAsIndicator"
  95 "id_Neighbouring_CellInformationItem_RL_SetupFailureFDD"
  96 "id_Neighbouring_CellInformationItem_RL_SetupRsp"
  97 "id_NonCombiningItem_RL_AdditionFailureFDD"
  98 "id_NonCombiningItem_RL_AdditionRspFDD"
  99 "id_NonCombiningItem_RL_AdditionRspTDD"
  100 "id_NonCombiningOrIEnotPresenItem_RL_SetupFailureFDD"
  101 "id_NonCombiningOrIEnotPresenItem_RL_SetupRspFDD"
  102 "id_PagingArea_PagingRqst"
  103 "id_PriorityIndicatorAndInitialWindowSizeListIE_CTCH_ResourceRspFDD"
  104 "id_PriorityIndicatorAndInitialWindowSizeListIE_CTCH_ResourceRspTDD"
  105 "id_PriorityIndicatorAndInitialWindowSizeListIE_option_CTCH_ResourceRspFDD"
  106 "id_PriorityIndicatorAndInitialWindowSizeListIE_option_CTCH_ResourceRspTDD"
  107 "id_PowerAdjustmentType"
  108 "id_ProcedureScope_DL_PC_Rqst"
  109 "id_RANAP_RelocationInformation"
  110 "id_RL_Information_PhyChReconfRqstFDD"
  111 "id_RL_Information_PhyChReconfRqstTDD"
  112 "id_RL_Information_RL_AdditionRqstFDD"
  113 "id_RL_Information_RL_AdditionRqstTDD"
  114 "id_RL_Information_RL_DeletionRqst"
  115 "id_RL_Information_RL_FailureInd"
  116 "id_RL_Information_RL_ReconfPrepFDD"
  117 "id_RL_Information_RL_RestoreInd"
  118 "id_RL_Information_RL_SetupRqstFDD"
  119 "id_RL_Information_RL_SetupRqstTDD"
  120 "id_RL_InformationItem_DM_Rprt"
  121 "id_RL_InformationItem_DM_Rqst"
  122 "id_RL_InformationItem_DM_Rsp"
  123 "id_RL_InformationItem_RL_SetupRqstFDD"
  124 "id_RL_InformationList_RL_AdditionRqstFDD"
  125 "id_RL_InformationList_RL_DeletionRqst"
  126 "id_RL_InformationList_RL_ReconfPrepFDD"
  127 "id_RL_InformationResponse_RL_AdditionRspTDD"
  128 "id_RL_InformationResponse_RL_ReconfReadyTDD"
  129 "id_RL_InformationResponse_RL_SetupRspTDD"
  130 "id_RL_InformationResponseItem_RL_AdditionRspFDD"
  131 "id_RL_InformationResponseItem_RL_ReconfReadyFDD"
  132 "id_RL_InformationResponseItem_RL_ReconfRsp"
  133 "id_RL_InformationResponseItem_RL_SetupRspFDD"
  134 "id_RL_InformationResponseList_RL_AdditionRspFDD"
  135 "id_RL_InformationResponseList_RL_ReconfReadyFDD"
  136 "id_RL_InformationResponseList_RL_ReconfRsp"
  137 "id_RL_InformationResponseList_RL_SetupRspFDD"
  138 "id_RLItem_DM_Rprt"
  139 "id_RLItem_DM_Rqst"
  140 "id_RLItem_DM_Rsp"
  141 "id_RL_ReconfigurationFailure_RL_ReconfFail"
  142 "id_RL_ReconfigurationFailureList_RL_ReconfFail"
  143 "id_RL_Set_InformationItem_DM_Rprt"
  144 "id_RL_Set_InformationItem_DM_Rqst"
  145 "id_RL_Set_InformationItem_DM_Rsp"
  146 "id_RL_Set_Information_RL_FailureInd"
  147 "id_RL_Set_Information_RL_RestoreInd"
  148 "id_RL_SetItem_DM_Rprt"
  149 "id_RL_SetItem_DM_Rqst"
  150 "id_RL_SetItem_DM_Rsp"
  151 "id_RNCsWithCellsInTheAccessedURA_List_UL_ST_Ind"
  152 "id_ReportCharacteristics"
  153 "id_Reporting_Object_RL_FailureInd"
  154 "id_Reporing_Object_RL_RestoreInd"
  155 "id_S_RNTI"
  156 "id_SAI"
  157 "id_SRNC_ID"
  158 "id_SecondaryCCPCHListIE_CTCH_ResourceRspTDD"
  159 "id_SuccessfulRL_InformationResponse_RL_AdditionFailureFDD"
  160 "id_SuccessfulRL_InformationResponse_RL_SetupFailureFDD"
  161 "id_SuccessfulRL_InformationResponseList_RL_AdditionFailureFDD"
  162 "id_SuccessfulRL_InformationResponseList_RL_SetupFailureFDD"
  163 "id_TransportBearerID"
  164 "id_TransportBearerRequestIndicator"
  165 "id_TransportLayerAddress"
  166 "id_UC_ID"
  167 "id_UL_CCTrCH_Information_RL_ReconfPrepTDD"
  168 "id_UL_CCTrCH_InformationItem_RL_ReconfRqstTDD"
  169 "id_UL_CCTrCH_InformationList_RL_ReconfPrepTDD"
  170 "id_UL_CCTrCH_InformationList_RL_ReconfRqstTDD"
  171 "id_UL_CCTrCH_InformationItem_RL_SetupRqstTDD"
  172 "id_UL_CCTrCH_InformationList_RL_SetupRqstTDD"
  173 "id_UL_CCTrCH_InformationListIE_PhyChReconfRqstTDD"
  174 "id_UL_CCTrCH_InformationListIE_RL_AdditionRspTDD"
  175 "id_UL_CCTrCH_InformationListIE_RL_ReconfReadyTDD"
  176 "id_UL_CCTrCH_InformationListIE_RL_SetupRspTDD"
  177 "id_UL_DPCH_Information_RL_ReconfPrepFDD"
  178 "id_UL_DPCH_Information_RL_ReconfRqstFDD"
  179 "id_UL_DPCH_Information_RL_SetupRqstFDD"
  180 "id_UL_DPCH_InformationItem_PhyChReconfRqstTDD"
  181 "id_UL_DPCH_InformationItem_RL_AdditionRspTDD"
  182 "id_UL_DPCH_InformationItem_RL_SetupRspTDD"
  183 "id_UL_DPCH_InformationListIE_RL_ReconfReadyTDD"
  184 "id_UL_SIRTarget"
  185 "id_URA_ID"
  186 "id_URAItem_PagingRqst"
  187 "id_UnsuccessfulRL_InformationResponse"
  188 "id_UnsuccessfulRL_InformationResponse_RL_AdditionFailureFDD"
  189 "id_UnsuccessfulRL_InformationResponse_RL_SetupFailureFDD"
  190 "id_UnsuccessfulRL_InformationResponse_RL_SetupFailureTDD"
  191 "id_UnsuccessfulRL_InformationResponseList_RL_AdditionFailureFDD"
  192 "id_UnsuccessfulRL_InformationResponseList_RL_SetupFailureFDD"
  193 "id_Pcp_Length"
  194 "id_CM_PatternInformationList_RL_SetupRqstFDD"
  195 "id_CM_PatternInformationItem_RL_SetupRqstFDD"
  196 "id_ScramblingCodeChange"
  197 "id_CompressedModeIndicator"
  198 "id_DSCH_Information_RL_SetupRqstFDD"
  199 "id_DSCH_AddOrModifyList_RL_ReconfPrepFDD"
  200 "id_DSCH_DeleteList_RL_ReconfPrepFDD"
  201 "id_Cause_Level_CompressedModeFail"
  202 "id_RL_ReconfigurationFailure_CompressedModeFail"
  203 "id_Cause_Level_RL_ReconfFail"
  204 "id_ResetType"
  205 "id_IE_IPAddressSet"
}

# One public IE: id, criticality, length determinant, and the value chosen by
# the id. The length is kept but never bounds or skips the value.
rule RNSAP_IE {
  align
  field 736 16 "IE ID" values IeIds keep $IeId
  field 737 2 "Criticality" values Criticality
  align
  field 738 1 "IE LENGTH Type" keep $LengthForm
  field 741 7 "IE LENGTH" keep $IeLength if $LengthForm == 0
  if $LengthForm != 0 {
    field 743 1 "IE LENGTH Type2"
    field 744 14 "IE LENGTH" keep $IeLength
  }
  dispatch $IeId ie
}

# A list item, or a sub list, written as a protocol IE container.
rule protocolIEs {
  align
  field 3354 16 "  ProtocolIEContainer COUNT" keep $ProtocolIeCount
  set $RlIdPosition = $ProtocolIeCount
  set $RlSetIdPosition = $ProtocolIeCount
  repeat $ProtocolIeCount { call RNSAP_IE }
}

# One container of a container list.
rule Container "" {
  align
  field 3362 16 "  ContainersIE COUNT" keep $ContainersIeCount
  repeat $ContainersIeCount { call RNSAP_IE }
}

# The container lists, by the form of their count. The forms counted with an
# added 1 read one container for a count of 0; all but 3382 load the position
# counters of the numbered RL fields.
family ContainerList{M} "" {
  member 3358 3358
  member 3383 3383
  member 3367 3367
  member 3364 3364
  member 3373 3373
} {
  field ~3358 4 " ContainerList COUNT" length $ContainerListCount
  set $RlIdPosition = $ContainerListCount
  set $RlSetIdPosition = $ContainerListCount
  repeat $ContainerListCount { call Container }
}

rule ContainerList3379 "" {
  field 3379 5 " ContainerList COUNT" keep $ContainerListCount
  set $RlIdPosition = $ContainerListCount
  set $RlSetIdPosition = $ContainerListCount
  repeat $ContainerListCount { call Container }
}

rule ContainerList3382 "" {
  field 3382 4 " ContainerList COUNT" keep $ContainerListCount
  repeat $ContainerListCount { call Container }
}

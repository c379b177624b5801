values Flag { 0 "off" 1 "on" }
rule RNSAP_PDU "PDU" {
  field 10 1 "Kind" values Flag keep $Kind
  field 11 4 "  Count" count N
  repeat N { call Item }
  set Bits = N * 8 / 2
  if Bits > 4 && $Kind == 1 { field 12 8 "  Extra" minus 5 }
  select $Kind (id label) {
    1: 13 "  One"
    else: 14 "  Other"
  } {
    field id 2 label
  }
  align
}
rule Item { field 20 3 "  Count" values { other "v%u" 7 "seven" } if $Kind == 1 }
rule Unused { field 30 1 "  Unused" }

# Value lists that many fields share.

# "  Extension Ext", "  Extension Bit" and the message's extension switch.
values ExtensionFlag { 0 "no extension" 1 "extension" }

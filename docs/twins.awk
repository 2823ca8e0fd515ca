# Doxygen input filter: the headers say things once for a pair or a small group of prototypes. Each
# prototype that follows another without a gap gets the same documentation.
/^(WAVKIT_API|typedef) / && follows { print "/** @copydoc " documented " */" }
/^WAVKIT_API / && !follows { documented = $0; sub(/\(.*/, "", documented); sub(/.*[ *]/, "", documented) }
/^typedef void / && !follows { documented = $0; sub(/.*\(\*/, "", documented); sub(/\).*/, "", documented) }
/^(WAVKIT_API|typedef) / { open = 1; follows = 0 }
{ print }
open && /;/ { open = 0; follows = 1; next }
!open { follows = 0 }

// The commands, one line for each, in the order in which the help lists them. Whoever wants the list defines
// KVT_COMMAND(name) and includes this, perhaps more than once; hence no include guard.

KVT_COMMAND(convert)
KVT_COMMAND(translate)
KVT_COMMAND(infer)
KVT_COMMAND(encodings)
KVT_COMMAND(text)
KVT_COMMAND(match)
KVT_COMMAND(number)
KVT_COMMAND(wwjd)
KVT_COMMAND(date)
KVT_COMMAND(sort)
KVT_COMMAND(unique)
KVT_COMMAND(memory)
KVT_COMMAND(doctor)
KVT_COMMAND(explain)
KVT_COMMAND(tzdata)

// The words of all commands with their codes, and the lookup by what a typed word begins.
#include "core/command_table.h"

#include <cctype>
#include <cstring>

// Order matters: a typed word is the first command that it begins, so `o` is opt, `ocil` ocilogoff, and ocilogon must
// stand before ocilogon2.
constexpr Command kCommandTable[] = {
    {"exit", 76}, {"quit", 76}, {"opt", 50}, {"read", 77}, {"ocienvcreate", 200}, {"xaoenv", 368}, {"xaosvcctx", 369},
    {"xaosterr", 376}, {"quickconnectoci", 350}, {"killenvoci", 351}, {"fetchalloci", 352}, {"ocienvinit", 201},
    {"ociinitialize", 202}, {"ocilogoff", 203}, {"readini", 52}, {"ocihandlealloc", 204}, {"ocithreadmutexinit", 378},
    {"ocithreadmutexdestroy", 379}, {"ocithreadmutexacquire", 380}, {"ocithreadmutexrelease", 381},
    {"ocithreadkeyinit", 385}, {"ocithreadidinit", 389}, {"ocithreadhndinit", 396}, {"ocithreadkeydestroy", 386},
    {"ocithreadiddestroy", 390}, {"ocithreadhnddestroy", 397}, {"ocithreadidnull", 391}, {"ocithreadidsame", 393},
    {"ocithreadidget", 392}, {"ocithreadhandleget", 398}, {"ocithreadcreate", 399}, {"ocithreadclose", 400},
    {"ocithreadjoin", 401}, {"ocithreadidset", 395}, {"ocithreadidsetnull", 394}, {"ocithreadkeyset", 387},
    {"ocithreadkeyget", 388}, {"ocithreadinit", 383}, {"ocithreadterm", 384}, {"ocihandlefree", 205},
    {"ocisessionpooldestroy", 402}, {"ociconnectionpooldestroy", 405}, {"ocisessionpoolcreate", 403},
    {"ociconnectionpoolcreate", 404}, {"olog", 414}, {"sqllda", 445}, {"sqlld2", 452}, {"oermsg", 449},
    {"opinit", 440}, {"ocisvcctxtolda", 434}, {"oopen", 416}, {"getcda", 448}, {"ocan", 429}, {"ofen", 435},
    {"ofetch", 436}, {"oexec", 430}, {"oexfet", 431}, {"oexn", 432}, {"oopt", 451}, {"oparse", 417}, {"odescr", 420},
    {"ologof", 415}, {"oclose", 421}, {"orol", 418}, {"obreak", 428}, {"odessp", 450}, {"ocom", 419}, {"onbclr", 437},
    {"onbtst", 439}, {"onbset", 438}, {"ocon", 422}, {"ocof", 423}, {"ocilogon", 206}, {"ocilogon2", 207},
    {"ociserverattach", 208}, {"ociserverdetach", 209}, {"ocisessionbegin", 210}, {"ocisessionget", 407},
    {"ocisessionrelease", 408}, {"ocisessionend", 211}, {"ociterminate", 212}, {"ocidescriptoralloc", 213},
    {"ociarraydescriptoralloc", 409}, {"ocidescriptorfree", 214}, {"ociarraydescriptorfree", 410},
    {"ocitranscommit", 215}, {"ocitransrollback", 216}, {"ocitransstart", 370}, {"ocitransdetach", 371},
    {"ocitransforget", 375}, {"ocitransprepare", 372}, {"ocitransmultiprepare", 374}, {"ocithreadprocessinit", 377},
    {"ocithreadismulti", 382}, {"ociclientversion", 217}, {"ociserverversion", 218}, {"ociping", 219},
    {"ocibreak", 347}, {"ocireset", 353}, {"ocinumberabs", 220}, {"ocinumberadd", 221}, {"ocinumberarccos", 222},
    {"ocinumberarcsin", 223}, {"ocinumberarctan", 224}, {"ocinumberarctan2", 225}, {"ocinumberassign", 226},
    {"ocinumberceil", 227}, {"ocinumbercmp", 228}, {"ocinumbercos", 229}, {"ocinumberdec", 230},
    {"ocinumberdiv", 231}, {"ocinumberexp", 232}, {"ocinumberfloor", 233}, {"ocinumberfromint", 234},
    {"ocinumberfromreal", 235}, {"ocinumberfromtext", 236}, {"ocinumberhypcos", 237}, {"ocinumberhypsin", 238},
    {"ocinumberhyptan", 239}, {"ocinumberinc", 240}, {"ocinumberintpower", 241}, {"ocinumberisint", 242},
    {"ocinumberiszero", 243}, {"ocinumberln", 244}, {"ocinumberlog", 245}, {"ocinumbermod", 246},
    {"ocinumbermul", 247}, {"ocinumberneg", 248}, {"ocinumberpower", 249}, {"ocinumberprec", 250},
    {"ocinumberround", 251}, {"ocinumbersetpi", 252}, {"ocinumbersetzero", 253}, {"ocinumbershift", 254},
    {"ocinumbersign", 255}, {"ocinumbersin", 256}, {"ocinumbersqrt", 257}, {"ocinumbersub", 258},
    {"ocinumbertan", 259}, {"ocinumbertoint", 260}, {"ocinumbertoreal", 261}, {"ocinumbertorealarray", 262},
    {"ocinumbertotext", 263}, {"ocinumbertrunc", 264}, {"ocistringallocsize", 265}, {"ocirawallocsize", 355},
    {"ocistringassign", 266}, {"ocirawassignraw", 357}, {"ocistringassigntext", 267}, {"ocirawassignbytes", 356},
    {"ocistringptr", 268}, {"ocirawptr", 358}, {"ocistringresize", 269}, {"ocirawresize", 354},
    {"ocistringsize", 270}, {"ocirawsize", 359}, {"ocifileclose", 271}, {"ocifileexists", 272}, {"ocifileflush", 273},
    {"ocifilegetlength", 274}, {"ocifileinit", 275}, {"ocifileopen", 276}, {"ocifileread", 277}, {"ocifileseek", 278},
    {"ocifileterm", 279}, {"ocifilewrite", 280}, {"ocipasswordchange", 281}, {"ocidateadddays", 282},
    {"ocidateaddmonths", 283}, {"ocidateassign", 284}, {"ocidatecheck", 285}, {"ocidatecompare", 286},
    {"ocidatedaysbetween", 287}, {"ocidatefromtext", 288}, {"ocidatelastday", 289}, {"ocidatenextday", 290},
    {"ocidatesysdate", 291}, {"ocidatetotext", 292}, {"ocidatetimeassign", 293}, {"ocidatetimecheck", 294},
    {"ocidatetimecompare", 295}, {"ocirowidtochar", 411}, {"ocidatetimeconstruct", 296}, {"ocidatetimegetdate", 331},
    {"ocidatetimegettime", 332}, {"ocidatetimesetdate", 333}, {"ocidatetimesettime", 334}, {"ocilobisopen", 297},
    {"ocilobappend", 298}, {"ocilobtrim", 299}, {"ocilobcopy", 300}, {"ocilobassign", 301}, {"ocilobisequal", 302},
    {"ociloblocatorisinit", 303}, {"ociloblocatorassign", 304}, {"ocilobenablebuffering", 305},
    {"ocilobdisablebuffering", 306}, {"ocilobflushbuffer", 307}, {"ociloberase", 308}, {"ocilobgetlength", 309},
    {"ocilobclose", 310}, {"ocilobopen", 412}, {"ocistmtexecute", 311}, {"ocildatosvcctx", 433},
    {"ocistmtfetch", 312}, {"ocistmtfetch2", 313}, {"ocistmtprepare", 314}, {"ocistmtprepare2", 315},
    {"ocistmtrelease", 316}, {"ociattrget", 317}, {"ociattrset", 318}, {"getmemoci", 319}, {"initxid", 373},
    {"getmemstructoci", 341}, {"freememoci", 328}, {"freememstructoci", 344}, {"assignstmttostruct", 360},
    {"listoci", 320}, {"liststructoci", 343}, {"ocidefinebypos", 321}, {"odefin", 427}, {"odefinps", 426},
    {"ocidefinedynamic", 337}, {"ocidefinearrayofstruct", 340}, {"ocibindarrayofstruct", 345},
    {"ocibinddynamic", 338}, {"ocistmtgetpieceinfo", 348}, {"ogetpi", 424}, {"ocistmtsetpieceinfo", 349},
    {"osetpi", 425}, {"ociresultsettostmt", 346}, {"setbinddynamicbuffers", 339}, {"ocidescribeany", 322},
    {"ocibindbyname", 323}, {"obindps", 441}, {"obndra", 442}, {"obndrv", 443}, {"obndrn", 444},
    {"ocistmtgetbindinfo", 336}, {"ocibindbypos", 324}, {"updatememoci", 325}, {"updatememstructoci", 342},
    {"assigntexttolob", 335}, {"updatelobdescriptorctype", 326}, {"updatebuffer", 361}, {"ocilobread", 362},
    {"oflng", 447}, {"ocilobwrite", 363}, {"ocilobistemporary", 364}, {"ocilobfreetemporary", 365},
    {"ocilobcreatetemporary", 366}, {"ociparamget", 327}, {"ocierrorget", 329}, {"setcallerroroci", 330},
    {"writeini", 51}, {"deletefile", 367}, {"memdebug", 446}, {"setlocale", 413}, {"pause", 406}, {"xaopen", 186},
    {"xaclose", 187}, {"xastart", 188}, {"xaend", 189}, {"xaprepare", 190}, {"xacommit", 191}, {"xarollback", 192},
    {"xaforget", 193}, {"xarecover", 194},
    {nullptr, 0}};

static_assert(sizeof kCommandTable / sizeof *kCommandTable == kCommandCount + 1);

// The first four characters rule most rows out; every word of the table has as many, a closing zero counted.
static bool Begins(const char* folded, size_t length, const char* word) {
    constexpr size_t kHead = 4;
    if (length >= kHead && std::memcmp(folded, word, kHead) != 0) return false;
    return std::strncmp(folded, word, length) == 0;
}

const Command* FindCommand(const char* word) {
    char folded[32];
    const size_t length = std::strlen(word);
    if (length == 0 || length > sizeof folded) return nullptr;  // no command is that long
    for (size_t index = 0; index < length; ++index)
        folded[index] = static_cast<char>(std::tolower(static_cast<unsigned char>(word[index])));
    for (const Command* row = kCommandTable; row->word != nullptr; ++row)
        if (Begins(folded, length, row->word)) return row;
    return nullptr;
}

void HandlerTable::Set(const CommandRow& row, void (*run)(const CommandRow&, int, char**)) {
    handlers_[row.code] = {&row, run};
}

const HandlerTable::Handler* HandlerTable::Find(int code) const {
    if (code < 0 || code > kHighestCommandCode || handlers_[code].row == nullptr) return nullptr;
    return &handlers_[code];
}

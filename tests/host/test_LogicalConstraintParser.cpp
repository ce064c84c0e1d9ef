#include "ConstraintRecorders.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

using tsd_test::RecordingLogicalParser;

namespace {

struct FormCase {
    const char* text;
    const char* call; // the one callback, as RecordingLogicalParser writes it
};

std::string parseOne(RecordingLogicalParser& p, const char* text) {
    p.clear();
    bool failed = p.parse(text);
    std::string result = p.only();
    if (failed)
        result += " (parse failed";
    for (const auto& e : p.errors)
        result += " code " + std::to_string(e.code) + " col " + std::to_string(e.column) +
                  " token '" + e.token + "'";
    if (failed)
        result += ")";
    return result;
}

void expectForms(const std::vector<FormCase>& cases) {
    RecordingLogicalParser p;
    for (const FormCase& c : cases)
        EXPECT_EQ(parseOne(p, c.text), c.call) << c.text;
}

// Texts the library writes and hands back (canonical forms).
TEST(LogicalParser, CanonicalGroupForms) {
    expectForms({
        {"TIMEGRP grp=FFS:RISING:clkgrp:EXCEPT:slow_ffs ;",
         "TIMEGRP grp in=[FFS,RISING clkgrp] ex=[slow_ffs]"},
        {"TIMEGRP A= ;", "TIMEGRP A in=[] ex=[]"},
        {"TIMEGRP A=:EXCEPT:b ;", "TIMEGRP A in=[] ex=[b]"},
        {"TIMEGRP A=FALLING:x:TRANSHI:y:TRANSLO:z:w ;",
         "TIMEGRP A in=[FALLING x,TRANSHI y,TRANSLO z,w] ex=[]"},
        {"TIMEGRP A=a:EXCEPT:b:c ;", "TIMEGRP A in=[a] ex=[b,c]"},
        {"TIMEGRP A=\"*odd\":top/sub/ffs:FFS(data*) ;",
         "TIMEGRP A in=[*odd,top/sub/ffs,FFS(data*)] ex=[]"},
        // A member called OFFSET: the '=' after the group name decides.
        {"TIMEGRP A=OFFSET ;", "TIMEGRP A in=[OFFSET] ex=[]"},
        {"TIMEGRP A=OFFSET:IN ;", "TIMEGRP A in=[OFFSET,IN] ex=[]"},
    });
}

TEST(LogicalParser, CanonicalTimespecForms) {
    expectForms({
        {"TIMESPEC TS01=FROM:ffs_a:TO:ffs_b:10:nS ;",
         "MAXDELAY TS01 from=1 to=1 [ffs_a,ffs_b] value=10000ps prio=- dpo=0"},
        {"TIMESPEC TS03=FROM:pads:THRU:t1:THRU:t2:TO:ffs:TS01/2:DATAPATHONLY ;",
         "MAXDELAY TS03 from=1 to=1 [pads,t1,t2,ffs] link=TS01/2 prio=- dpo=1"},
        {"TIMESPEC TS04=FROM:ram:TO:pads:TIG:PRIORITY:1 ;",
         "TIG TS04 from=1 to=1 [ram,pads] prio=1"},
        {"TIMESPEC TS09=TO:b:10:nS ;", "MAXDELAY TS09 from=0 to=1 [b] value=10000ps prio=- dpo=0"},
        {"TIMESPEC TS10=THRU:t:2.5:nS:PRIORITY:-3 ;",
         "MAXDELAY TS10 from=0 to=0 [t] value=2500ps prio=-3 dpo=0"},
        {"TIMESPEC TS11=FROM:a:TS02*2 ;", "MAXDELAY TS11 from=1 to=0 [a] link=TS02*2 prio=- dpo=0"},
        {"TIMESPEC TS12=TIG ;", "TIG TS12 from=0 to=0 [] prio=-"},
        {"TIMESPEC TS13=10:nS ;", "MAXDELAY TS13 from=0 to=0 [] value=10000ps prio=- dpo=0"},
        {"TIMESPEC TS14=FROM:a:TO:b:100:MHz ;",
         "MAXDELAY TS14 from=1 to=1 [a,b] value=10000ps(freq) prio=- dpo=0"},
        {"TIMESPEC TS05=PERIOD:clk:10:nS:HIGH:50% ;",
         "PERIOD TS05 group=clk value=10000ps phase=+0 duty=HIGH/0/50% jitter=- prio=-"},
        {"TIMESPEC TS06=PERIOD:clk2:TS01*2:PHASE:+:2.5:nS:LOW:4:nS ;",
         "PERIOD TS06 group=clk2 link=TS01*2 phase=+2500 duty=LOW/4000/0% jitter=- prio=-"},
        {"TIMESPEC TS07=PERIOD:sys:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3 ;",
         "PERIOD TS07 group=sys value=10000ps(freq) phase=+0 duty=HIGH/0/0% jitter=200 prio=3"},
        {"TIMESPEC TS08=PERIOD:\"*odd\":10000:pS ;",
         "PERIOD TS08 group=*odd value=10000ps phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMESPEC TS15=PERIOD:clk:TS01:PHASE:-:1:nS ;",
         "PERIOD TS15 group=clk link=TS01/0 phase=-1000 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMESPEC TS16=PERIOD:clk:TS01/2.5 ;",
         "PERIOD TS16 group=clk link=TS01/2.5 phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMESPEC TS05=DROP_SPEC ;", "DROP_SPEC TS05"},
    });
}

TEST(LogicalParser, CanonicalOffsetAndPathControlForms) {
    expectForms({
        {"OFFSET=IN:2:nS:BEFORE:clk ;", "OFFSET IN 2000 valid=- BEFORE clk hl=(null)"},
        {"OFFSET=OUT:5:nS:AFTER:clk:TIMEGRP:outregs ;",
         "ROFFSET OUT 5000 valid=- AFTER clk hl=(null) reg=outregs"},
        {"OFFSET=IN:1:nS:VALID:3:nS:BEFORE:clk:HIGH ;",
         "OFFSET IN 1000 valid=3000 BEFORE clk hl=HIGH"},
        {"TIMEGRP:data_pads:OFFSET=IN:2:nS:BEFORE:clk ;",
         "TOFFSET pad=data_pads IN 2000 valid=- BEFORE clk hl=(null)"},
        {"TIMEGRP:pads:OFFSET=IN:2:nS:BEFORE:clk:TIMEGRP:regs:LOW ;",
         "TROFFSET pad=pads IN 2000 valid=- BEFORE clk hl=LOW reg=regs"},
        {"OFFSET=IN:-1.5:nS:BEFORE:clk ;", "OFFSET IN -1500 valid=- BEFORE clk hl=(null)"},
        // The reduced texts of the OFFSET reducer end in ':' before the ';'.
        {"OFFSET=IN:0:BEFORE:clk: ;", "OFFSET IN 0 valid=- BEFORE clk hl=(null)"},
        {"TIMEGRP:pads:OFFSET=IN:0:BEFORE:clk: ;",
         "TOFFSET pad=pads IN 0 valid=- BEFORE clk hl=(null)"},
        {"ENABLE=delay_1 ;", "ENABLE delay_1"},
        {"DISABLE= ;", "DISABLE (null)"},
    });
}

TEST(LogicalParser, HandWrittenForms) {
    expectForms({
        {"TIMESPEC TS01 = PERIOD \"clk\" 10 ns HIGH 50% ;",
         "PERIOD TS01 group=clk value=10000ps phase=+0 duty=HIGH/0/50% jitter=- prio=-"},
        {"TIMESPEC TS02 = FROM a THRU t1 TO b TS01 / 2 ;",
         "MAXDELAY TS02 from=1 to=1 [a,t1,b] link=TS01/2 prio=- dpo=0"},
        {"OFFSET = IN 2 ns VALID 3 ns BEFORE clk ;",
         "OFFSET IN 2000 valid=3000 BEFORE clk hl=(null)"},
        {"TIMEGRP pads OFFSET = OUT 1.5 ns AFTER clk TIMEGRP regs HIGH;",
         "TROFFSET pad=pads OUT 1500 valid=- AFTER clk hl=HIGH reg=regs"},
        // HIGH/LOW and TIMEGRP after the clock come in either order; HIGH/LOW as written.
        {"OFFSET = IN 2 ns BEFORE clk high TIMEGRP regs ;",
         "ROFFSET IN 2000 valid=- BEFORE clk hl=high reg=regs"},
        {"timespec TS1 = from a to b 1e-3 US datapathonly priority +7 ;",
         "MAXDELAY TS1 from=1 to=1 [a,b] value=1000ps prio=7 dpo=1"},
        {"TIMESPEC TS1 = FROM a TO b 10 ns PRIORITY 2 DATAPATHONLY ;",
         "MAXDELAY TS1 from=1 to=1 [a,b] value=10000ps prio=2 dpo=1"},
        {"TIMESPEC TS1 = PERIOD clk 250 kHz LOW 40 ;",
         "PERIOD TS1 group=clk value=4000000ps(freq) phase=+0 duty=LOW/0/40% jitter=- prio=-"},
        {"TIMESPEC TS1 = PERIOD clk 2 GHz ;",
         "PERIOD TS1 group=clk value=500ps(freq) phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMESPEC TS1 = PERIOD clk 1 ms INPUT_JITTER 0 ;",
         "PERIOD TS1 group=clk value=1000000000ps phase=+0 duty=HIGH/0/0% jitter=0 prio=-"},
        {"\t TIMEGRP A = b c\n;\n", "TIMEGRP A in=[b,c] ex=[]"},
        {"ENABLE = \"reg sr:o\" ;", "ENABLE reg sr:o"},
        {"TIMESPEC 'TS 1' = TIG ;", "TIG TS 1 from=0 to=0 [] prio=-"},
        {"TIMESPEC TS1 = FROM a TO b \"TS0:2\" * 3 ;",
         "MAXDELAY TS1 from=1 to=1 [a,b] link=TS0:2*3 prio=- dpo=0"},
        {"TIMESPEC TS1 = FROM a TO b ts02 ;",
         "MAXDELAY TS1 from=1 to=1 [a,b] link=ts02/0 prio=- dpo=0"},
    });
}

// A name is read by its position: keywords, numbers and TSids where a name
// must stand are names.
TEST(LogicalParser, NamesAreReadByPosition) {
    expectForms({
        {"TIMESPEC TS01=PERIOD:9ns:10:nS ;",
         "PERIOD TS01 group=9ns value=10000ps phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMESPEC TS01=FROM:FFS:TO:TS02:1:nS ;",
         "MAXDELAY TS01 from=1 to=1 [FFS,TS02] value=1000ps prio=- dpo=0"},
        {"TIMESPEC TS01=FROM:TO:TO:THRU:1 ;",
         "MAXDELAY TS01 from=1 to=1 [TO,THRU] value=1000ps prio=- dpo=0"},
        {"TIMESPEC PERIOD=PERIOD:PERIOD:1 ;",
         "PERIOD PERIOD group=PERIOD value=1000ps phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"OFFSET=IN:2:BEFORE:TIMEGRP:TIMEGRP:HIGH:HIGH ;",
         "ROFFSET IN 2000 valid=- BEFORE TIMEGRP hl=HIGH reg=HIGH"},
        {"OFFSET=IN:2:BEFORE:TIMEGRP:TIMEGRP:HIGH ;",
         "ROFFSET IN 2000 valid=- BEFORE TIMEGRP hl=(null) reg=HIGH"},
        // Edge keywords and EXCEPT are keywords only when a name follows.
        {"TIMEGRP A=RISING:RISING ;", "TIMEGRP A in=[RISING RISING] ex=[]"},
        {"TIMEGRP A=FFS:RISING ;", "TIMEGRP A in=[FFS,RISING] ex=[]"},
        {"TIMEGRP A=RISING:EXCEPT:b ;", "TIMEGRP A in=[RISING EXCEPT,b] ex=[]"},
        {"TIMEGRP A=x:EXCEPT ;", "TIMEGRP A in=[x,EXCEPT] ex=[]"},
        {"TIMEGRP A=x:EXCEPT:EXCEPT ;", "TIMEGRP A in=[x] ex=[EXCEPT]"},
        {"TIMEGRP A=\"RISING\":x ;", "TIMEGRP A in=[RISING,x] ex=[]"},
        {"TIMEGRP EXCEPT=EXCEPT:y ;", "TIMEGRP EXCEPT in=[] ex=[y]"},
    });
}

// A predefined-group pattern is one name wherever a group name stands,
// however it is spelt: quoted parts inside the parentheses and blanks
// before "(" are dropped from the name.
TEST(LogicalParser, PatternsAreOneNameInEveryPosition) {
    struct Spelling {
        const char* text;
        const char* name;
    };
    const Spelling spellings[] = {
        {"FFS(data*)", "FFS(data*)"},
        {"FFS(\"data*\")", "FFS(data*)"},
        {"FFS('data*')", "FFS(data*)"},
        {"FFS (\"data*\")", "FFS(data*)"},
        {"ffs \t (data*)", "ffs(data*)"},
        {"pads(\"A<*>\")", "pads(A<*>)"},
        {"RAMS (\"*i_huffman*\")", "RAMS(*i_huffman*)"},
        {"LATCHES(top/\"a b\"/*)", "LATCHES(top/a b/*)"},
        {"PPS(\"x\"\"y\")", "PPS(x\"y)"},
        {"Pads('a:b;c=d')", "Pads(a:b;c=d)"},
    };
    struct Position {
        const char* text; // "@" stands for the spelling
        const char* call; // "@" stands for the name
    };
    const Position positions[] = {
        {"TIMEGRP A=@ ;", "TIMEGRP A in=[@] ex=[]"},
        {"TIMEGRP A = x RISING @ @ EXCEPT @ ;", "TIMEGRP A in=[x,RISING @,@] ex=[@]"},
        {"TIMESPEC TS1 = FROM @ THRU @ TO @ 5 ns ;",
         "MAXDELAY TS1 from=1 to=1 [@,@,@] value=5000ps prio=- dpo=0"},
        {"TIMESPEC TS1 = FROM @ TO @ TIG ;", "TIG TS1 from=1 to=1 [@,@] prio=-"},
        {"TIMESPEC TS1 = PERIOD @ 10 ns ;",
         "PERIOD TS1 group=@ value=10000ps phase=+0 duty=HIGH/0/0% jitter=- prio=-"},
        {"TIMEGRP @ OFFSET = IN 2 ns BEFORE clk TIMEGRP @ ;",
         "TROFFSET pad=@ IN 2000 valid=- BEFORE clk hl=(null) reg=@"},
        {"OFFSET = OUT 2 ns AFTER @ TIMEGRP @ ;",
         "ROFFSET OUT 2000 valid=- AFTER @ hl=(null) reg=@"},
    };
    auto fill = [](std::string form, const char* with) {
        for (std::size_t at = form.find('@'); at != std::string::npos; at = form.find('@', at))
            form.replace(at, 1, with), at += std::strlen(with);
        return form;
    };
    RecordingLogicalParser p;
    for (const Spelling& s : spellings)
        for (const Position& at : positions) {
            const std::string text = fill(at.text, s.text);
            EXPECT_EQ(parseOne(p, text.c_str()), fill(at.call, s.name)) << text;
        }
    // Only the five keywords form patterns, and only "(" after blanks joins.
    expectForms({
        {"TIMEGRP A = rams (x) FFSX (y) ;", "TIMEGRP A in=[rams(x),FFSX,(y)] ex=[]"},
        {"TIMEGRP A = FFS:(x) FFS x ;", "TIMEGRP A in=[FFS,(x),FFS,x] ex=[]"},
        {"TIMEGRP A = FFS(a)b FFS(a(b)\"c\") ;", "TIMEGRP A in=[FFS(a)b,FFS(a(b)c)] ex=[]"},
        {"TIMEGRP A = \"a\"\"b\" 'it''s' ;", "TIMEGRP A in=[a\"b,it's] ex=[]"},
    });
}

// Different spellings of one constraint give the same callback arguments.
TEST(LogicalParser, SpellingsOfOneConstraintAgree) {
    const std::vector<std::vector<const char*>> groups = {
        {"TIMESPEC TS05=PERIOD:clk:10:nS:HIGH:50% ;",
         "TIMESPEC TS05 = PERIOD \"clk\" 10 ns HIGH 50% ;",
         "timespec TS05 = period clk 10ns high 50;", "TIMESPEC TS05=PERIOD:clk:10000:pS:HIGH:50% ;",
         "TIMESPEC TS05 = PERIOD clk 0.01 us HIGH 50 % ;",
         "TIMESPEC TS05 = PERIOD 'clk' 1e1 Ns HIGH 5e1 ;",
         "TIMESPEC:TS05=PERIOD:clk:10:HIGH:50:%;"},
        {"TIMESPEC TS02=FROM:a:THRU:t1:TO:b:TS01/2 ;",
         "TIMESPEC TS02 = FROM a THRU t1 TO b TS01 / 2 ;",
         "TIMESPEC TS02 = FROM a THRU t1 TO b TS01/ 2 ;",
         "TIMESPEC TS02 = FROM a THRU t1 TO b TS01 /2 ;",
         "TIMESPEC TS02=FROM:a:THRU:t1:TO:b:TS01:/:2 ;",
         "TIMESPEC TS02 = FROM a THRU t1 TO b TS01 : / : 2 ;",
         "TIMESPEC TS02 = FROM \"a\" THRU 't1' TO b TS01/2.0;"},
        {"TIMESPEC TS06=PERIOD:c:TS01*2:PHASE:+:2.5:nS ;",
         "TIMESPEC TS06 = PERIOD c TS01 * 2 PHASE + 2.5 ns ;",
         "TIMESPEC TS06 = PERIOD c TS01*2 PHASE +2.5ns ;",
         "TIMESPEC TS06 = PERIOD c TS01*2 PHASE 2500 ps ;",
         "TIMESPEC TS06 = PERIOD c TS01 *2 PHASE 2.5 ;"},
        {"TIMESPEC TS06=PERIOD:c:TS01*2:PHASE:-:2:nS ;",
         "TIMESPEC TS06 = PERIOD c TS01*2 PHASE - 2 ns ;",
         "TIMESPEC TS06 = PERIOD c TS01*2 PHASE -2ns ;"},
        {"OFFSET=IN:2:nS:VALID:3:nS:BEFORE:clk ;", "OFFSET = IN 2 ns VALID 3 ns BEFORE clk ;",
         "offset = in 2ns valid 3000ps before \"clk\";",
         "OFFSET=IN:2000:pS:VALID:3000:pS:BEFORE:clk ;"},
        {"TIMEGRP grp=FFS:RISING:clkgrp:EXCEPT:slow_ffs ;",
         "TIMEGRP grp = FFS RISING clkgrp EXCEPT slow_ffs ;",
         "timegrp grp = \"FFS\" rising 'clkgrp' except slow_ffs;"},
        {"TIMEGRP:data_pads:OFFSET=IN:2:nS:BEFORE:clk ;",
         "TIMEGRP data_pads OFFSET = IN 2 ns BEFORE clk ;"},
        {"OFFSET=IN:0:BEFORE:clk: ;", "OFFSET = IN 0 ns BEFORE clk ;",
         "OFFSET=IN:0:nS:BEFORE:clk ;"},
    };
    RecordingLogicalParser p;
    for (const auto& group : groups) {
        std::string first = parseOne(p, group[0]);
        EXPECT_EQ(first.find("parse failed"), std::string::npos) << group[0] << ": " << first;
        for (const char* text : group)
            EXPECT_EQ(parseOne(p, text), first) << text;
    }
}

struct ErrorCase {
    const char* text;
    int code;
    int column;
    const char* token;
};

TEST(LogicalParser, SyntaxErrorsReportTokenAndColumn) {
    const std::vector<ErrorCase> cases = {
        // empty texts
        {"", CONSTRAINT_ERR_EMPTY, 1, ""},
        {"   ", CONSTRAINT_ERR_EMPTY, 4, ""},
        {" ;", CONSTRAINT_ERR_EMPTY, 2, ";"},
        // unknown keywords and keywords out of place
        {"FOO=1 ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 1, "FOO"},
        {"PERIOD=10:nS ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 1, "PERIOD"},
        {"\"TIMEGRP\" A=b ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 1, "\"TIMEGRP\""},
        {"TIMESPEC TS01=PERIOD:clk:10:nS:HIHG:50% ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 32, "HIHG"},
        {"TIMESPEC TS01=PERIOD:clk:10:nS:TIG ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 32, "TIG"},
        {"TIMESPEC TS01=PERIODIC:clk:10 ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 15, "PERIODIC"},
        {"TIMESPEC TS01=HIGH:clk:10 ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 15, "HIGH"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:DATAPATHONLY:TIG ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 43,
         "TIG"},
        {"TIMESPEC TS01=FROM:a:TIG:DATAPATHONLY ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 26,
         "DATAPATHONLY"},
        {"OFFSET=SIDEWAYS:2:nS:BEFORE:clk ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 8, "SIDEWAYS"},
        {"OFFSET=IN:2:nS:DURING:clk ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 16, "DURING"},
        {"TIMEGRP A=b:EXCEPT:RISING:c ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 20, "RISING"},
        {"TIMEGRP A=b:EXCEPT:c:EXCEPT:d ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 22, "EXCEPT"},
        // what the OFFSET reducer removes is not part of this language
        {"OFFSET=IN:2:nS:BEFORE:clk:RISING ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 27, "RISING"},
        {"OFFSET=IN:2:nS:BEFORE:clk:REFERENCE_PIN:p ;", CONSTRAINT_ERR_UNEXPECTED_TOKEN, 27,
         "REFERENCE_PIN"},
        {"OFFSET=IN::BEFORE:clk ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 11, ":"},
        {"OFFSET=IN:BEFORE:clk ;", CONSTRAINT_ERR_EXPECTED_VALUE, 11, "BEFORE"},
        // missing parts
        {"TIMESPEC TS01=PERIOD ;", CONSTRAINT_ERR_EXPECTED_NAME, 22, ";"},
        {"TIMESPEC TS01=PERIOD:clk ;", CONSTRAINT_ERR_EXPECTED_VALUE, 26, ";"},
        {"TIMESPEC TS01=FROM:a:TO:b ;", CONSTRAINT_ERR_EXPECTED_VALUE, 27, ";"},
        {"TIMESPEC TS01= ;", CONSTRAINT_ERR_EXPECTED_VALUE, 16, ";"},
        {"TIMESPEC =PERIOD:clk:1 ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 10, "="},
        {"TIMESPEC ;", CONSTRAINT_ERR_EXPECTED_NAME, 10, ";"},
        {"TIMESPEC TS01=FROM:a:TO:b:TS02* ;", CONSTRAINT_ERR_EXPECTED_VALUE, 33, ";"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:PRIORITY ;", CONSTRAINT_ERR_EXPECTED_VALUE, 39, ";"},
        {"TIMESPEC TS01=PERIOD:clk:10:HIGH ;", CONSTRAINT_ERR_EXPECTED_VALUE, 34, ";"},
        {"TIMESPEC TS01=PERIOD:clk:10:PHASE:- ;", CONSTRAINT_ERR_EXPECTED_VALUE, 37, ";"},
        {"TIMESPEC TS01 PERIOD clk 10 ns ;", CONSTRAINT_ERR_EXPECTED_EQUALS, 15, "PERIOD"},
        {"TIMEGRP A B ;", CONSTRAINT_ERR_EXPECTED_EQUALS, 11, "B"},
        {"TIMEGRP:pads:OFFSET IN 2 BEFORE clk ;", CONSTRAINT_ERR_EXPECTED_EQUALS, 21, "IN"},
        {"ENABLE delay ;", CONSTRAINT_ERR_EXPECTED_EQUALS, 8, "delay"},
        // malformed numbers, bad units, absurd values
        {"TIMESPEC TS01=PERIOD:clk:10xs ;", CONSTRAINT_ERR_BAD_UNIT, 28, "xs"},
        {"TIMESPEC TS01=PERIOD:clk:10nsx ;", CONSTRAINT_ERR_BAD_UNIT, 28, "nsx"},
        {"TIMESPEC TS01=PERIOD:clk:2e:ns ;", CONSTRAINT_ERR_BAD_UNIT, 27, "e"},
        {"TIMESPEC TS01=PERIOD:clk:1.2.3:ns ;", CONSTRAINT_ERR_BAD_NUMBER, 26, "1.2.3"},
        {"TIMESPEC TS01=PERIOD:clk:10:% ;", CONSTRAINT_ERR_BAD_UNIT, 29, "%"},
        {"TIMESPEC TS01=PERIOD:clk:10:HIGH:5:MHz ;", CONSTRAINT_ERR_BAD_UNIT, 36, "MHz"},
        {"TIMESPEC TS01=PERIOD:clk:10:PHASE:1:MHz ;", CONSTRAINT_ERR_BAD_UNIT, 37, "MHz"},
        {"OFFSET=IN:2:MHz:BEFORE:clk ;", CONSTRAINT_ERR_BAD_UNIT, 13, "MHz"},
        {"TIMESPEC TS01=FROM:a:TO:b:TS02*2ns ;", CONSTRAINT_ERR_BAD_UNIT, 33, "ns"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:PRIORITY:1.5 ;", CONSTRAINT_ERR_BAD_NUMBER, 39, "1.5"},
        {"TIMESPEC TS01=PERIOD:clk:nan:ns ;", CONSTRAINT_ERR_EXPECTED_VALUE, 26, "nan"},
        {"TIMESPEC TS01=PERIOD:clk:inf ;", CONSTRAINT_ERR_EXPECTED_VALUE, 26, "inf"},
        {"TIMESPEC TS01=PERIOD:clk:1e999:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, 26, "1e999"},
        {"TIMESPEC TS01=PERIOD:clk:1e300:ms ;", CONSTRAINT_ERR_OUT_OF_RANGE, 26, "1e300"},
        {"TIMESPEC TS01=PERIOD:clk:0:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, 26, "0"},
        {"TIMESPEC TS01=PERIOD:clk:0:MHz ;", CONSTRAINT_ERR_OUT_OF_RANGE, 26, "0"},
        {"TIMESPEC TS01=PERIOD:clk:-5:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, 26, "-5"},
        {"TIMESPEC TS01=FROM:a:TO:b:-1:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, 27, "-1"},
        {"TIMESPEC TS01=PERIOD:clk:10:HIGH:150% ;", CONSTRAINT_ERR_OUT_OF_RANGE, 34, "150%"},
        {"TIMESPEC TS01=PERIOD:clk:10:HIGH:0 ;", CONSTRAINT_ERR_OUT_OF_RANGE, 34, "0"},
        {"TIMESPEC TS01=PERIOD:clk:10:LOW:0:ns ;", CONSTRAINT_ERR_OUT_OF_RANGE, 33, "0"},
        {"TIMESPEC TS01=PERIOD:clk:10:PHASE:-:-2 ;", CONSTRAINT_ERR_EXPECTED_VALUE, 37, "-2"},
        {"TIMESPEC TS01=FROM:a:TO:b:TS02/0 ;", CONSTRAINT_ERR_OUT_OF_RANGE, 32, "0"},
        {"TIMESPEC TS01=FROM:a:TO:b:TS02*-2 ;", CONSTRAINT_ERR_OUT_OF_RANGE, 32, "-2"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:PRIORITY:2147483647 ;", CONSTRAINT_ERR_OUT_OF_RANGE, 39,
         "2147483647"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:PRIORITY:-2147483649 ;", CONSTRAINT_ERR_OUT_OF_RANGE, 39,
         "-2147483649"},
        {"TIMESPEC TS01=FROM:a:TO:b:10:PRIORITY:99999999999999999999999 ;",
         CONSTRAINT_ERR_OUT_OF_RANGE, 39, "99999999999999999999999"},
        {"OFFSET=IN:2:VALID:-1:BEFORE:clk ;", CONSTRAINT_ERR_OUT_OF_RANGE, 19, "-1"},
        // options given twice
        {"TIMESPEC TS01=PERIOD:clk:10:HIGH:50%:LOW:40% ;", CONSTRAINT_ERR_DUPLICATE, 38, "LOW"},
        {"TIMESPEC TS01=FROM:a:TO:b:1:PRIORITY:1:PRIORITY:2 ;", CONSTRAINT_ERR_DUPLICATE, 40,
         "PRIORITY"},
        {"TIMESPEC TS01=FROM:a:TO:b:1:DATAPATHONLY:DATAPATHONLY ;", CONSTRAINT_ERR_DUPLICATE, 42,
         "DATAPATHONLY"},
        {"OFFSET=IN:2:BEFORE:clk:HIGH:LOW ;", CONSTRAINT_ERR_DUPLICATE, 29, "LOW"},
        {"OFFSET=IN:2:BEFORE:clk:TIMEGRP:a:TIMEGRP:b ;", CONSTRAINT_ERR_DUPLICATE, 34, "TIMEGRP"},
        // quotes and characters; an empty quoted name names nothing
        {"DISABLE=\"\" ;", CONSTRAINT_ERR_EXPECTED_NAME, 9, "\"\""},
        {"TIMEGRP A=b:'' ;", CONSTRAINT_ERR_EXPECTED_NAME, 13, "''"},
        {"OFFSET=IN:2:BEFORE:\"\" ;", CONSTRAINT_ERR_EXPECTED_NAME, 20, "\"\""},
        {"TIMESPEC TS1=FROM:a:\"\"*2 ;", CONSTRAINT_ERR_EXPECTED_NAME, 21, "\"\""},
        {"TIMESPEC TS01=PERIOD:\"clk:10:nS ;", CONSTRAINT_ERR_UNBALANCED_QUOTE, 22,
         "\"clk:10:nS ;"},
        {"TIMEGRP A='b ;", CONSTRAINT_ERR_UNBALANCED_QUOTE, 11, "'b ;"},
        {"TIMEGRP A=b\x01 ;", CONSTRAINT_ERR_INVALID_CHARACTER, 12, "\x01"},
        {"TIMEGRP A=\"b\x7f\" ;", CONSTRAINT_ERR_INVALID_CHARACTER, 13, "\x7f"},
        {"TIMEGRP A=\"b\"c ;", CONSTRAINT_ERR_MISSING_SEPARATOR, 14, "c"},
        {"TIMEGRP A=b\"c\" ;", CONSTRAINT_ERR_MISSING_SEPARATOR, 12, "\"c\""},
        {"TIMEGRP A=FFS(\"b ;", CONSTRAINT_ERR_UNBALANCED_QUOTE, 15, "\"b ;"},
        {"TIMEGRP A=FFS(\"b\x01\") ;", CONSTRAINT_ERR_INVALID_CHARACTER, 17, "\x01"},
        {"TIMEGRP A=FFS(b)\"c\" ;", CONSTRAINT_ERR_MISSING_SEPARATOR, 17, "\"c\""},
        // separators where none may stand
        {":TIMESPEC TS01=TIG ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 1, ":"},
        {"TIMESPEC TS01=PERIOD::clk:10:nS ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 22, ":"},
        {"TIMESPEC TS01=PERIOD=clk:10:nS ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 21, "="},
        {"TIMESPEC TS01==TIG ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 15, "="},
        {"TIMESPEC TS01:=TIG ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 14, ":"},
        {"TIMESPEC TS01=:TIG ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 15, ":"},
        {"TIMEGRP A=::b ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 12, ":"},
        {"TIMEGRP A=OFFSET=IN:2:BEFORE:clk ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 17, "="},
        {"OFFSET=IN:2:BEFORE:clk:: ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 24, ":"},
        {"OFFSET=IN:2:BEFORE:clk= ;", CONSTRAINT_ERR_STRAY_SEPARATOR, 23, "="},
        // the end of the text
        {"TIMESPEC TS01=PERIOD:clk:10:nS", CONSTRAINT_ERR_MISSING_SEMICOLON, 31, ""},
        {"OFFSET = IN 2 ns BEFORE clk", CONSTRAINT_ERR_MISSING_SEMICOLON, 28, ""},
        {"TIMESPEC TS01=PERIOD:clk", CONSTRAINT_ERR_EXPECTED_VALUE, 25, ""},
        {"TIMESPEC TS01=PERIOD:clk:10:nS ; x", CONSTRAINT_ERR_TRAILING_TEXT, 34, "x"},
        {"TIMESPEC TS01=PERIOD:clk:10:nS ;;", CONSTRAINT_ERR_TRAILING_TEXT, 33, ";"},
        {"TIMESPEC TS01=PERIOD:clk:10:nS ; :", CONSTRAINT_ERR_TRAILING_TEXT, 34, ":"},
        {"ENABLE=a ; DISABLE=b ;", CONSTRAINT_ERR_TRAILING_TEXT, 12, "DISABLE"},
        {"ENABLE=a b ;", CONSTRAINT_ERR_UNKNOWN_KEYWORD, 10, "b"},
    };
    RecordingLogicalParser p;
    for (const ErrorCase& c : cases) {
        p.clear();
        EXPECT_TRUE(p.parse(c.text)) << c.text;
        EXPECT_TRUE(p.calls.empty()) << c.text;
        ASSERT_EQ(p.errors.size(), 1u) << c.text;
        EXPECT_EQ(p.errors[0].code, c.code)
            << c.text << " (" << constraintErrorText(p.errors[0].code) << ")";
        EXPECT_EQ(p.errors[0].column, c.column) << c.text;
        EXPECT_EQ(p.errors[0].token, c.token) << c.text;
    }
}

// The builder draws its caret at column - 10 below "name=value" of a TIMESPEC
// it wrote as "TIMESPEC name=value ;": the column must count from 1.
TEST(LogicalParser, ColumnLinesUpWithTheDefinitionText) {
    const std::string name = "TS01", value = "FROM:a:TO:b:10:nS:PRIORTY:2";
    const std::string text = "TIMESPEC " + name + "=" + value + " ;";
    RecordingLogicalParser p;
    ASSERT_TRUE(p.parse(text.c_str()));
    ASSERT_EQ(p.errors.size(), 1u);
    const std::string echoed = name + "=" + value;
    const auto caret = static_cast<std::size_t>(p.errors[0].column - 10);
    EXPECT_EQ(echoed.substr(caret, p.errors[0].token.size()), "PRIORTY");
}

TEST(LogicalParser, NullTextIsAnEmptyText) {
    RecordingLogicalParser p;
    EXPECT_TRUE(p.parse(nullptr));
    ASSERT_EQ(p.errors.size(), 1u);
    EXPECT_EQ(p.errors[0].code, CONSTRAINT_ERR_EMPTY);
    EXPECT_EQ(p.errors[0].column, 1);
}

TEST(LogicalParser, CallbackAnsweringFalseFailsTheParseWithoutError) {
    const char* texts[] = {
        "ENABLE=a ;",
        "OFFSET=IN:2:BEFORE:clk ;",
        "TIMEGRP:p:OFFSET=IN:2:BEFORE:clk ;",
        "OFFSET=IN:2:BEFORE:clk:TIMEGRP:r ;",
        "TIMEGRP:p:OFFSET=IN:2:BEFORE:clk:TIMEGRP:r ;",
        "TIMESPEC TS1=FROM:a:1 ;",
        "TIMESPEC TS1=PERIOD:c:1 ;",
        "TIMESPEC TS1=TIG ;",
        "TIMESPEC TS1=DROP_SPEC ;",
        "TIMEGRP A=b ;",
    };
    RecordingLogicalParser p;
    p.answer = false;
    for (const char* text : texts) {
        p.clear();
        EXPECT_TRUE(p.parse(text)) << text;
        EXPECT_EQ(p.calls.size(), 1u) << text;
        EXPECT_TRUE(p.errors.empty()) << text;
    }
    p.answer = true;
    for (const char* text : texts)
        EXPECT_FALSE(p.parse(text)) << text;
}

TEST(LogicalParser, DefaultCallbacksAcceptEverything) {
    LogicalConstraintParser p;
    EXPECT_FALSE(p.parse("TIMESPEC TS1=PERIOD:c:1 ;"));
    EXPECT_FALSE(p.parse("TIMEGRP A=b ;"));
    EXPECT_TRUE(p.parse("TIMEGRP A=b"));
}

TEST(LogicalParser, HandleGivesKindAndPlace) {
    struct Case {
        const char* text;
        ConstraintHandle::Kind kind;
        int column;
        int length;
    };
    const Case cases[] = {
        {"TIMEGRP A=b ;", ConstraintHandle::KIND_TIMEGRP, 1, 13},
        {"  TIMESPEC TS1=TIG ;  ", ConstraintHandle::KIND_TIMESPEC, 3, 18},
        {"TIMEGRP:p:OFFSET=IN:2:BEFORE:clk ;", ConstraintHandle::KIND_OFFSET, 1, 34},
        {"OFFSET=IN:2:BEFORE:clk ;", ConstraintHandle::KIND_OFFSET, 1, 24},
        {" ENABLE=a;", ConstraintHandle::KIND_ENABLE, 2, 9},
        {"DISABLE= ;", ConstraintHandle::KIND_DISABLE, 1, 10},
    };
    RecordingLogicalParser p;
    for (const Case& c : cases) {
        p.clear();
        ASSERT_FALSE(p.parse(c.text)) << c.text;
        ASSERT_EQ(p.handles.size(), 1u);
        EXPECT_EQ(p.handles[0].kind(), c.kind) << c.text;
        EXPECT_EQ(p.handles[0].column(), c.column) << c.text;
        EXPECT_EQ(p.handles[0].length(), c.length) << c.text;
    }
}

// Buffers are reused: strings of one parse are those of that parse, after a
// longer or shorter text, and a parse started from a callback leaves the
// strings of the outer callback intact.
TEST(LogicalParser, BuffersAreReusedSafely) {
    RecordingLogicalParser p;
    std::string many = "TIMEGRP big=";
    for (int i = 0; i < 500; ++i)
        many += "member_" + std::to_string(i) + ":";
    many += "EXCEPT:last ;";
    ASSERT_FALSE(p.parse(many.c_str()));
    ASSERT_FALSE(p.parse("TIMEGRP s=x ;"));
    ASSERT_EQ(p.calls.size(), 2u);
    EXPECT_NE(p.calls[0].find("member_499"), std::string::npos);
    EXPECT_EQ(p.calls[1], "TIMEGRP s in=[x] ex=[]");

    struct Nesting : RecordingLogicalParser {
        std::string seen;
        bool cb_timegrp(const char* name,
                        const std::vector<std::pair<const char*, ParserEdge>>& includes,
                        const std::vector<const char*>& excludes,
                        const ConstraintHandle* h) override {
            bool innerFailed = parse("TIMESPEC TS_INNER=PERIOD:inner_clock:1 ;");
            seen = std::string(name) + "/" + includes[0].first + "/" + (innerFailed ? "f" : "ok");
            return RecordingLogicalParser::cb_timegrp(name, includes, excludes, h);
        }
    } nesting;
    ASSERT_FALSE(nesting.parse("TIMEGRP outer=first_member ;"));
    EXPECT_EQ(nesting.seen, "outer/first_member/ok");
    ASSERT_EQ(nesting.calls.size(), 2u);
    EXPECT_EQ(nesting.calls[1], "TIMEGRP outer in=[first_member] ex=[]");
}

TEST(LogicalParser, ErrorTextsDescribeEveryCode) {
    for (int code = CONSTRAINT_ERR_EMPTY; code <= CONSTRAINT_ERR_TOO_LONG; ++code)
        EXPECT_STRNE(constraintErrorText(code), "error") << code;
    EXPECT_STREQ(constraintErrorText(0), "error");
}

} // namespace

// Functions and operators in the server's own language, in a schema that the session's search path has before the
// server's own: they take the place of what has the same name and types there. Bodies are bound when they are made, with
// the server's own names alone in the path. A date is a domain, so that a result tells that it is one;
// so is an interval of years and months, from which the server would cut days without a word.
#include "engine/postgres/schema.h"

namespace engine::postgres {

const char* const kSchemaCommands = R"sql(
begin;
select pg_catalog.pg_advisory_xact_lock(1801808752);
set local search_path = pg_catalog;
set local client_min_messages = error;
create schema if not exists kelp;
grant usage on schema kelp to public;
do $$
declare
    made record;
begin
    for made in
        select * from (values ('date', 'timestamp(0)'), ('raw', 'bytea'), ('long_raw', 'bytea'), ('long', 'text'),
            ('nclob', 'text'), ('dbclob', 'text'), ('year_month', 'interval check (extract(day from value) = 0 and
            extract(hour from value) = 0 and extract(minute from value) = 0 and extract(second from value) = 0)')) as list(name, type)
    loop
        begin
            execute format('create domain kelp.%I as %s', made.name, made.type);
        exception when duplicate_object then null;
        end;
    end loop;
end $$;

create or replace function kelp.fail(number int, words text) returns void language plpgsql as
$$ begin raise exception 'kelp error % %', number, words; end $$;

create or replace function kelp.sysdate() returns kelp.date stable parallel safe language sql
return date_trunc('second', statement_timestamp()::timestamp);
create or replace function kelp."current_date"() returns kelp.date stable parallel safe language sql
return date_trunc('second', statement_timestamp()::timestamp);
create or replace function kelp.systimestamp() returns timestamptz stable parallel safe language sql
return statement_timestamp();
create or replace function kelp."current_timestamp"() returns timestamptz stable parallel safe language sql
return statement_timestamp();
create or replace function kelp."localtimestamp"() returns timestamp stable parallel safe language sql
return statement_timestamp()::timestamp;

-- Numbers as text: no zero before the point. Texts as numbers. Empty texts are nulls.
create or replace function kelp.to_char(numeric) returns text immutable parallel safe language sql
return regexp_replace(trim_scale($1)::text, '^(-?)0\.', '\1.');
create or replace function kelp.to_char(double precision) returns text immutable parallel safe language sql
return kelp.to_char($1::numeric);
create or replace function kelp.to_char(bigint) returns text immutable parallel safe language sql return $1::text;
create or replace function kelp.to_char(int) returns text immutable parallel safe language sql return $1::text;
create or replace function kelp.to_char(text) returns text immutable parallel safe language sql return $1;
create or replace function kelp.to_number(text) returns numeric immutable parallel safe language sql return $1::numeric;
create or replace function kelp.to_number(numeric) returns numeric immutable parallel safe language sql return $1;

-- Models of dates: what the server writes otherwise, and what it does not know.
create or replace function kelp.date_model(model text) returns text immutable parallel safe language plpgsql as $$
declare
    plain text := upper(regexp_replace(model, '"[^"]*"', '', 'g'));
begin
    if plain ~ '(YEAR|SYYYY|SCC|DL|DS|TS|TZD|TZR|FF[1245789]|E)' and plain !~ '^[^E]*DE[^E]*$' then
        perform kelp.fail(1821, 'a date model with ' || model);
    end if;
    model := regexp_replace(model, 'X?FF3', case when plain ~ 'XFF' then '.MS' else 'MS' end, 'i');
    model := regexp_replace(model, 'X?FF6?', case when plain ~ 'XFF' then '.US' else 'US' end, 'i');
    return regexp_replace(regexp_replace(model, 'RRRR', 'YYYY', 'gi'), 'RR', 'YY', 'gi');
end $$;
create or replace function kelp.to_char(timestamp, text) returns text stable parallel safe language sql
return pg_catalog.to_char($1, kelp.date_model($2));
create or replace function kelp.to_char(timestamptz, text) returns text stable parallel safe language sql
return pg_catalog.to_char($1, kelp.date_model($2));
create or replace function kelp.to_char(timestamp) returns text stable parallel safe language sql
return pg_catalog.to_char($1, 'DD-MON-YY');
create or replace function kelp.read_date(words text, model text) returns timestamp stable parallel safe
language plpgsql as $$
declare
    moment timestamp := pg_catalog.to_timestamp(words, kelp.date_model(model))::timestamp;
begin
    if model ~* 'RR' and model !~* 'RRRR' and moment >= '2050-01-01' and moment < '2070-01-01' then
        moment := moment - interval '100 years';
    end if;
    return moment;
end $$;
create or replace function kelp.to_date(text, text default 'DD-MON-RR') returns kelp.date stable parallel safe
language sql return date_trunc('second', kelp.read_date($1, $2));
create or replace function kelp.to_date(timestamp) returns kelp.date stable parallel safe language sql
return date_trunc('second', $1);
create or replace function kelp.to_timestamp(text, text) returns timestamp stable parallel safe language sql
return kelp.read_date($1, $2);

-- Days are counted in numbers.
create or replace function kelp.add_days(timestamp, numeric) returns kelp.date immutable parallel safe language sql
return date_trunc('second', $1) + make_interval(secs => round($2 * 86400)::double precision);
create or replace function kelp.add_to_days(numeric, timestamp) returns kelp.date immutable parallel safe language sql
return kelp.add_days($2, $1);
create or replace function kelp.take_days(timestamp, numeric) returns kelp.date immutable parallel safe language sql
return kelp.add_days($1, -$2);
create or replace function kelp.days_between(timestamp, timestamp) returns numeric immutable parallel safe language sql
return round(extract(epoch from $1 - $2) / 86400, 20);
create or replace function kelp.last_day(timestamp) returns kelp.date immutable parallel safe language sql
return date_trunc('month', $1) + interval '1 month -1 day' + ($1 - date_trunc('day', $1));
create or replace function kelp.add_months(timestamp, numeric) returns kelp.date immutable parallel safe language sql
return case when $1 = kelp.last_day($1) then kelp.last_day($1 + make_interval(months => trunc($2)::int))
            else $1 + make_interval(months => trunc($2)::int) end;
create or replace function kelp.months_between(timestamp, timestamp) returns numeric immutable parallel safe language sql
return (extract(year from $1) - extract(year from $2)) * 12 + extract(month from $1) - extract(month from $2)
    + case when extract(day from $1) = extract(day from $2) or ($1 = kelp.last_day($1) and $2 = kelp.last_day($2)) then 0
           else kelp.days_between($1 - (date_trunc('month', $1) - date_trunc('month', $2)), $2) / 31 end;
create or replace function kelp.next_day(day timestamp, name text) returns kelp.date stable strict parallel safe
language plpgsql as $$
begin
    for ahead in 1..7 loop
        if upper(pg_catalog.to_char(day + make_interval(days => ahead), 'FMDAY')) like upper(name) || '%'
            and length(name) >= 3 then
            return day + make_interval(days => ahead);
        end if;
    end loop;
    perform kelp.fail(1846, name);
end $$;
create or replace function kelp.trunc(timestamp) returns kelp.date immutable parallel safe language sql
return date_trunc('day', $1);
create or replace function kelp.trunc(day timestamp, unit text) returns kelp.date immutable strict parallel safe
language plpgsql as $$
begin
    return case upper(unit)
        when 'DD' then date_trunc('day', day) when 'DDD' then date_trunc('day', day) when 'J' then date_trunc('day', day)
        when 'MM' then date_trunc('month', day) when 'MON' then date_trunc('month', day)
        when 'MONTH' then date_trunc('month', day) when 'Q' then date_trunc('quarter', day)
        when 'YYYY' then date_trunc('year', day) when 'YY' then date_trunc('year', day)
        when 'RR' then date_trunc('year', day) when 'Y' then date_trunc('year', day)
        when 'YEAR' then date_trunc('year', day) when 'IW' then date_trunc('week', day)
        when 'HH24' then date_trunc('hour', day) when 'HH' then date_trunc('hour', day)
        when 'HH12' then date_trunc('hour', day) when 'MI' then date_trunc('minute', day)
        when 'D' then date_trunc('day', day) - make_interval(days => extract(dow from day)::int)
        when 'DAY' then date_trunc('day', day) - make_interval(days => extract(dow from day)::int)
        when 'DY' then date_trunc('day', day) - make_interval(days => extract(dow from day)::int)
        else kelp.no_unit(unit) end;
end $$;
create or replace function kelp.no_unit(unit text) returns timestamp language plpgsql as
$$ begin perform kelp.fail(1898, unit); return null; end $$;

-- Numbers.
create or replace function kelp.mod(numeric, numeric) returns numeric immutable parallel safe language sql
return case when $2 = 0 then $1 else pg_catalog.mod($1, $2) end;
create or replace function kelp.mod(int, int) returns numeric immutable parallel safe language sql
return kelp.mod($1::numeric, $2::numeric);
create or replace function kelp.mod(bigint, bigint) returns numeric immutable parallel safe language sql
return kelp.mod($1::numeric, $2::numeric);
create or replace function kelp.trunc(numeric, numeric) returns numeric immutable parallel safe language sql
return pg_catalog.trunc($1, trunc($2)::int);
create or replace function kelp.round(numeric, numeric) returns numeric immutable parallel safe language sql
return pg_catalog.round($1, trunc($2)::int);

-- Texts.
create or replace function kelp.concatenate(text, text) returns text immutable parallel safe language sql
return nullif(coalesce($1, '') || coalesce($2, ''), '');
create or replace function kelp.substr(words text, start numeric, size numeric) returns text immutable parallel safe
language sql return case when size < 1 then null else nullif(substring(words from
    (case when trunc(start) = 0 then 1 when start > 0 then trunc(start) else char_length(words) + trunc(start) + 1 end)::int
    for (case when trunc(start) < 0 and char_length(words) + trunc(start) < 0 then 0 else least(trunc(size), 1000000000) end)::int),
    '') end;
create or replace function kelp.substr(text, numeric) returns text immutable parallel safe language sql
return kelp.substr($1, $2, 1000000000);
create or replace function kelp.substr(text, int, int) returns text immutable parallel safe language sql
return kelp.substr($1, $2::numeric, $3::numeric);
create or replace function kelp.substr(text, int) returns text immutable parallel safe language sql
return kelp.substr($1, $2::numeric);
create or replace function kelp.instr(words text, part text, start numeric default 1, turn numeric default 1)
returns numeric immutable parallel safe language plpgsql as $$
declare
    size int := char_length(words);
    step int := sign(start);
    place int := case when start < 0 then size + trunc(start) + 1 else trunc(start) end;
    found int := 0;
begin
    if turn < 1 then perform kelp.fail(1428, 'an occurrence of ' || turn); end if;
    if words is null or part is null or start is null or turn is null then return null; end if;
    while step <> 0 and place between 1 and size loop
        if substring(words from place for char_length(part)) = part then found := found + 1; end if;
        if found = trunc(turn) then return place; end if;
        place := place + step;
    end loop;
    return 0;
end $$;
create or replace function kelp.lpad(text, numeric, text default ' ') returns text immutable parallel safe language sql
return nullif(pg_catalog.lpad($1, trunc($2)::int, $3), '');
create or replace function kelp.rpad(text, numeric, text default ' ') returns text immutable parallel safe language sql
return nullif(pg_catalog.rpad($1, trunc($2)::int, $3), '');
create or replace function kelp.lpad(text, int) returns text immutable parallel safe language sql
return nullif(pg_catalog.lpad($1, $2), '');
create or replace function kelp.lpad(text, int, text) returns text immutable parallel safe language sql
return nullif(pg_catalog.lpad($1, $2, $3), '');
create or replace function kelp.rpad(text, int) returns text immutable parallel safe language sql
return nullif(pg_catalog.rpad($1, $2), '');
create or replace function kelp.rpad(text, int, text) returns text immutable parallel safe language sql
return nullif(pg_catalog.rpad($1, $2, $3), '');
create or replace function kelp.replace(text, text) returns text immutable parallel safe language sql
return nullif(pg_catalog.replace($1, coalesce($2, ''), ''), '');
create or replace function kelp.replace(text, text, text) returns text immutable parallel safe language sql
return nullif(pg_catalog.replace($1, coalesce($2, ''), coalesce($3, '')), '');
create or replace function kelp.hextoraw(text) returns bytea immutable parallel safe language sql
return pg_catalog.decode($1, 'hex');
create or replace function kelp.empty_clob() returns text immutable parallel safe language sql return ''::text;
create or replace function kelp.empty_blob() returns bytea immutable parallel safe language sql return ''::bytea;
create or replace function kelp.rawtohex(bytea) returns text immutable parallel safe language sql
return upper(encode($1, 'hex'));

-- Choices.
create or replace function kelp.nvl2(anyelement, anycompatible, anycompatible) returns anycompatible immutable
parallel safe language sql as 'select case when $1 is null then $3 else $2 end';
create or replace function kelp.nvl2(text, anycompatible, anycompatible) returns anycompatible immutable
parallel safe language sql as 'select case when $1 is null then $3 else $2 end';
create or replace function kelp.greatest_of(variadic anycompatiblearray) returns anycompatible immutable parallel safe
language sql as 'select case when array_position($1, null) is null then (select max(x) from unnest($1) x) end';
create or replace function kelp.least_of(variadic anycompatiblearray) returns anycompatible immutable parallel safe
language sql as 'select case when array_position($1, null) is null then (select min(x) from unnest($1) x) end';
create or replace function kelp.max_date(timestamp, kelp.date) returns timestamp immutable parallel safe
language sql return case when $1 is null or $2 > $1 then $2 else $1 end;
create or replace function kelp.min_date(timestamp, kelp.date) returns timestamp immutable parallel safe
language sql return case when $1 is null or $2 < $1 then $2 else $1 end;
create or replace function kelp.as_date(timestamp) returns kelp.date immutable parallel safe language sql return $1;
create or replace aggregate kelp.max(kelp.date) (sfunc = kelp.max_date, stype = timestamp, finalfunc = kelp.as_date);
create or replace aggregate kelp.min(kelp.date) (sfunc = kelp.min_date, stype = timestamp, finalfunc = kelp.as_date);

-- Operators: what is not there yet of a list.
do $$
declare
    operator record;
begin
    for operator in
        select * from (values ('+', 'timestamp', 'numeric', 'add_days'), ('+', 'numeric', 'timestamp', 'add_to_days'),
            ('-', 'timestamp', 'numeric', 'take_days'), ('-', 'timestamp', 'timestamp', 'days_between'),
            ('||', 'text', 'text', 'concatenate')) as list(name, l, r, function)
    loop
        begin
            execute format('create operator kelp.%s (function = kelp.%s, leftarg = %s, rightarg = %s)',
                           operator.name, operator.function, operator.l, operator.r);
        exception when duplicate_function then null;
        end;
    end loop;
    -- Quotients of whole numbers have fractions.
    for operator in
        select l, r from unnest(array['smallint', 'int', 'bigint']) l, unnest(array['smallint', 'int', 'bigint']) r
    loop
        execute format('create or replace function kelp.quotient(%s, %s) returns numeric immutable parallel safe '
                       'language sql return $1::numeric / $2::numeric', operator.l, operator.r);
        begin
            execute format('create operator kelp./ (function = kelp.quotient, leftarg = %s, rightarg = %s)',
                           operator.l, operator.r);
        exception when duplicate_function then null;
        end;
    end loop;
    -- What is concatenated with a text is one.
    for operator in select * from unnest(array['int', 'bigint', 'numeric', 'double precision', 'timestamp']) t loop
        execute format('create or replace function kelp.concatenate(text, %1$s) returns text stable parallel safe '
                       'language sql return kelp.concatenate($1, kelp.to_char($2));'
                       'create or replace function kelp.concatenate(%1$s, text) returns text stable parallel safe '
                       'language sql return kelp.concatenate(kelp.to_char($1), $2)', operator.t);
        begin
            execute format('create operator kelp.|| (function = kelp.concatenate, leftarg = text, rightarg = %1$s);'
                           'create operator kelp.|| (function = kelp.concatenate, leftarg = %1$s, rightarg = text)',
                           operator.t);
        exception when duplicate_function then null;
        end;
    end loop;
    -- A text that is compared with a number is read as one.
    for operator in select * from unnest(array['=', '<>', '<', '>', '<=', '>=']) with ordinality as list(name, n) loop
        execute format('create or replace function kelp.compare_%2$s(text, numeric) returns boolean immutable parallel safe '
                       'language sql return $1::numeric %1$s $2;'
                       'create or replace function kelp.compare_%2$s(numeric, text) returns boolean immutable parallel safe '
                       'language sql return $1 %1$s $2::numeric', operator.name, operator.n);
        begin
            execute format('create operator kelp.%1$s (function = kelp.compare_%2$s, leftarg = text, rightarg = numeric);'
                           'create operator kelp.%1$s (function = kelp.compare_%2$s, leftarg = numeric, rightarg = text)',
                           operator.name, operator.n);
        exception when duplicate_function then null;
        end;
    end loop;
end $$;
comment on schema kelp is 'libkelpci 5';
commit;
)sql";

}  // namespace engine::postgres

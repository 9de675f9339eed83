# The demo host: answers on one number and on a column, and one-line errors
# with a non-zero exit status for bad input.
# Usage: cmake -DQELCALC=path -DWORK=dir -P check_qelcalc.cmake

function(run expect_rc expect_out)
  execute_process(COMMAND ${QELCALC} ${ARGN} OUTPUT_VARIABLE out ERROR_VARIABLE err
                  RESULT_VARIABLE rc INPUT_FILE ${WORK}/qelcalc_input.txt)
  if(NOT rc EQUAL expect_rc)
    message(SEND_ERROR "qelcalc ${ARGN}: exit ${rc}, expected ${expect_rc} (${err})")
  endif()
  if(NOT "${out}" MATCHES "${expect_out}")
    message(SEND_ERROR "qelcalc ${ARGN}: output '${out}' does not match '${expect_out}'")
  endif()
  if(NOT expect_rc EQUAL 0)
    string(REGEX MATCHALL "\n" newlines "${err}")
    list(LENGTH newlines n)
    if(NOT n EQUAL 1 OR NOT err MATCHES "^qelcalc: ")
      message(SEND_ERROR "qelcalc ${ARGN}: expected a one-line error, got '${err}'")
    endif()
  endif()
endfunction()

file(WRITE ${WORK}/qelcalc_input.txt "0.25\n\n0.5\n1\n")
file(WRITE ${WORK}/qelcalc_bad.txt "0.25\nabc\n")

run(0 "^0\\.5\n$" logistic cdf 0)
run(0 "^0\\.18242552380635[0-9]*\n$" logistic cdf 1.5 --location 0 --scale 1 --upper)
run(0 "^12\\.706204736174[0-9]*\n$" cauchy inv 0.975 --scale 1)
run(0 "^NaN\n$" cauchy inv 1)
run(0 "^-1\\.09861228866810[0-9]*\n0\nNaN\n$" logistic inv)
run(0 "^-1\\.09861228866810[0-9]*\n0\nNaN\n$" logistic inv --file -)
run(0 "^0\\.25\n0\\.5\n1\n$" uniform cdf --file ${WORK}/qelcalc_input.txt)
run(2 "^$" triangular pdf 0.5 --lower 0 --upper 1)
run(0 "^0\\.5\n$" triangular pdf 0.5 --lower 0 --mode 1 --upper 2)
run(0 "^0\\.125\n$" triangular cdf 1.5 --lower 0 --mode 1 --upper 2 --upper-tail)
run(0 "^2\n3\n5\n$" uniform inv --lower 1 --upper 5 --file ${WORK}/qelcalc_input.txt)
run(2 "^$" uniform cdf 0.5 --upper)
run(2 "^$" gauss cdf 1)
run(2 "^$" logistic median 1)
run(2 "^$" logistic cdf one)
run(2 "^$" logistic cdf 1 --shape 2)
run(2 "^$" logistic cdf 1 --scale)
run(2 "^$" logistic pdf 1 --upper)
run(2 "^$" logistic cdf --file ${WORK}/no_such_file.txt)
run(2 "^$" logistic cdf --file ${WORK}/qelcalc_bad.txt)
# A quantile beyond the double range is NaN.
run(0 "^NaN\n$" gamma inv 0.5 --shape 2 --scale 1.7976931348623157e308)
run(0 "^NaN\n$" loglogistic inv 0.999999999999 --scale 100)

# describe: summary lines of a column, from a file or stdin.
file(WRITE ${WORK}/qelcalc_describe.txt "2\n4\n4\n4\n5\n5\n7\n9\n")
run(0 "^n 8\nmean 5\nstddev 2\\.13808993529939[0-9]*\nskewness 0\\.8184875533567[0-9]*\nkurtosis 0\\.94062499999999[0-9]*\nsum 40\n$"
    describe --file ${WORK}/qelcalc_describe.txt)
run(0 "^n 3\nmean 0\\.58333333333333[0-9]*\nstddev 0\\.38188130791298[0-9]*\nskewness 0\\.93521952958282[0-9]*\nkurtosis NaN\nsum 1\\.75\n$"
    describe)
run(2 "^$" describe --file ${WORK}/qelcalc_bad.txt)
run(2 "^$" describe --file ${WORK}/no_such_file.txt)
run(2 "^$" describe 3)
run(2 "^$" describe --upper 1)
# Families on the ELV routines, P-values and critical values (values from mpmath).
run(0 "^0\\.02499789[0-9]*\n$" normal cdf 1.96 --upper)
run(0 "^0\\.04999579[0-9]*\n$" pvalue normal 1.96)
run(0 "^0\\.02499789[0-9]*\n$" pvalue normal -1.96 --alternative less)
run(0 "^2\\.22813885[0-9]*\n$" crit t 0.05 --df 10)
run(0 "^0\\.250282287597656[0-9]*\n$" binomial pdf 3 --n 10 --p 0.25)
run(0 "^0\\.60837482[0-9]*\n$" chisq cdf 3 --df 3)
run(2 "^$" binomial pdf 3 --n 10.5 --p 0.25)
run(2 "^$" pvalue normal 1 --alternative sideways)
run(2 "^$" pvalue gauss 1)
run(2 "^$" crit t 0.05)

# sample: draws one per line; a seed fixes them, another seed changes them.
run(0 "^(-?[0-9][0-9.e+-]*\n)(-?[0-9][0-9.e+-]*\n)(-?[0-9][0-9.e+-]*\n)(-?[0-9][0-9.e+-]*\n)(-?[0-9][0-9.e+-]*\n)$"
    sample normal 5 --mean 0 --sd 1 --seed 12345)
run(0 "^(2(\\.[0-9]+)?\n)+$" sample uniform 20 --lower 2 --upper 3 --seed 7)
run(0 "^([0-9]\n|10\n)+$" sample binomial 30 --n 10 --p 0.4 --seed 7)
run(0 "^$" sample poisson 0 --mean 3)
run(2 "^$" sample gamma 3 --shape -1 --seed 5)
run(2 "^$" sample gauss 3)
run(2 "^$" sample normal 3 --sigma 2)
run(2 "^$" sample normal -1)
run(2 "^$" sample normal)
run(2 "^$" sample binomial 3 --n 2.5)
foreach(attempt 1 2)
  execute_process(COMMAND ${QELCALC} sample normal 1000 --mean 0 --sd 1 --seed 12345
                  OUTPUT_VARIABLE draws_${attempt})
endforeach()
execute_process(COMMAND ${QELCALC} sample normal 1000 --mean 0 --sd 1 --seed 12346
                OUTPUT_VARIABLE draws_other)
if(NOT draws_1 STREQUAL draws_2)
  message(SEND_ERROR "qelcalc sample: the same seed gave different draws")
endif()
if(draws_1 STREQUAL draws_other)
  message(SEND_ERROR "qelcalc sample: different seeds gave the same draws")
endif()
string(REGEX MATCHALL "\n" lines "${draws_1}")
list(LENGTH lines n)
if(NOT n EQUAL 1000)
  message(SEND_ERROR "qelcalc sample normal 1000 wrote ${n} lines")
endif()

# ttest: the location tests on columns; expected values from
# tools/reference/gen_location_tests.py (tests/data/location_tests.csv).
file(WRITE ${WORK}/qelcalc_a10.txt "11.524\n12.832\n11.704\n13.698\n10.918\n13.643\n15.182\n14.38\n13.441\n12.368\n")
file(WRITE ${WORK}/qelcalc_b10.txt "12.2\n11.675\n9.081\n8.825\n11.462\n14.996\n9.67\n15.416\n12.448\n11.31\n")
file(WRITE ${WORK}/qelcalc_empty.txt "\n")
run(0 "^n 10\nmean 12\\.969[0-9]*\nstddev 1\\.34872828[0-9]*\nstderr 0\\.42650533[0-9]*\nlower 12\\.1871675[0-9]*\nupper 13\\.7508324[0-9]*\nt 4\\.61658938[0-9]*\np 0\\.00126044216[0-9]*\n$"
    ttest ${WORK}/qelcalc_a10.txt --mu 11 --confidence 0.9)
run(0 "\nstderr 0\\.63245553[0-9]*\nlower 11\\.9287032[0-9]*\nupper 14\\.0092967[0-9]*\nz 2\\.32269294[0-9]*\np 0\\.0201956537[0-9]*\n$"
    ttest ${WORK}/qelcalc_a10.txt --mu 11.5 --sigma 2 --confidence 0.9)
run(0 "\nmean_difference 1\\.2607[0-9]*\n.*\nlower -0\\.135566290[0-9]*\nupper 2\\.65696629[0-9]*\nt 1\\.65513232[0-9]*\np 0\\.132282309[0-9]*\n$"
    ttest ${WORK}/qelcalc_a10.txt --paired ${WORK}/qelcalc_b10.txt --confidence 0.9)
run(0 "\ndf 14\nlower -0\\.192991607[0-9]*\nupper 2\\.71439160[0-9]*\nt 1\\.52747919[0-9]*\np 0\\.148915229[0-9]*\n$"
    ttest ${WORK}/qelcalc_a10.txt --two-sample ${WORK}/qelcalc_b10.txt --confidence 0.9)
run(0 "\npooled_stddev 1\\.84553145[0-9]*\ndf 18\nlower -0\\.170503772[0-9]*\nupper 2\\.69190377[0-9]*\n"
    ttest ${WORK}/qelcalc_a10.txt --two-sample ${WORK}/qelcalc_b10.txt --pooled --confidence 0.9)
run(0 "\nlower -Inf\nupper " ttest ${WORK}/qelcalc_a10.txt --alternative less)
run(2 "^$" ttest ${WORK}/qelcalc_empty.txt)
run(2 "^$" ttest ${WORK}/qelcalc_bad.txt)
run(2 "^$" ttest ${WORK}/no_such_file.txt)
run(2 "^$" ttest ${WORK}/qelcalc_a10.txt --paired ${WORK}/qelcalc_input.txt)
run(2 "^$" ttest ${WORK}/qelcalc_a10.txt --pooled)
run(2 "^$" ttest ${WORK}/qelcalc_a10.txt --alternative sideways)

# test: location tests on columns of a CSV table with a header (P-values from R's t.test).
file(WRITE ${WORK}/qelcalc_table.csv "id,x,y\n1,5.1,4.8\n2,4.9,5.2\n3,6.2,5.0\n4,5.8,5.5\n5,6.0,\n")
run(0 "\np 0\\.039112442[0-9]*\n$" test one-sample-t ${WORK}/qelcalc_table.csv --column 2 --mu 5
    --alternative greater)
run(0 "\np 0\\.178222907[0-9]*\n$" test two-sample-t ${WORK}/qelcalc_table.csv --column 2
    --column2 3 --pooled)
# Paired by row: the row without y is dropped (and reported on stderr).
run(0 "^n 4\n" test paired-t ${WORK}/qelcalc_table.csv --column 2 --column2 3)
run(2 "^$" test one-sample-z ${WORK}/qelcalc_table.csv --column 2)
run(2 "^$" test one-sample-t ${WORK}/qelcalc_table.csv --column 9)
run(2 "^$" test sign-test ${WORK}/qelcalc_table.csv)
run(2 "^$" test one-sample-t ${WORK}/no_such_table.csv)
# fit and pplot: a Weibull sample of ten; parameters, covariances and the
# Anderson-Darling statistic from an independent maximisation in mpmath
# (tools/reference/gen_fits.py, sample weib10).
file(WRITE ${WORK}/qelcalc_weibull.txt "0.22903105840819976\n1.0313886063572855\n1.5271150070647668\n1.998648115685742\n2.2783700132260205\n2.665459312477814\n2.8916823966758307\n3.7179418860990685\n3.7959143492871568\n4.811415538424593\n")
run(0 "^n 10\nshape 1\\.86549452121850[0-9]*\nscale 2\\.78225423334351[0-9]*\nvar_shape 0\\.2445225479411[0-9]*\ncov 0\\.06872607921078[0-9]*\nvar_scale 0\\.2417526154057[0-9]*\nad_statistic 0\\.243860039638[0-9]*\nad_pvalue 0\\.25\nstatus 10004 [(]the P-value is a lower bound[)]\n$"
    fit ${WORK}/qelcalc_weibull.txt --dist weibull)
run(0 "^$" pplot ${WORK}/qelcalc_weibull.txt --dist normal --out ${WORK}/qelcalc_plot.csv)
file(STRINGS ${WORK}/qelcalc_plot.csv plot_lines)
list(LENGTH plot_lines n)
list(GET plot_lines 1 first_point)
if(NOT n EQUAL 11 OR NOT first_point MATCHES "^0\\.2290310584081997[0-9]*,0\\.0673076923076923[0-9]*,-1\\.4961468[0-9]*,")
  message(SEND_ERROR "qelcalc pplot: unexpected plot data '${plot_lines}'")
endif()
run(0 "^x,probability,score,fitted\n0\\.25,0\\.1666666666666666[0-9]*,-1\\.70198335528[0-9]*,[^\n]*\n0\\.5,0\\.5,[^\n]*\n1,0\\.833333333333333[34][0-9]*,[^\n]*\n$"
    pplot - --dist weibull --method midpoint)
run(2 "^$" fit ${WORK}/qelcalc_weibull.txt --dist gauss)
run(2 "^$" fit --dist weibull)
run(2 "^$" pplot ${WORK}/qelcalc_weibull.txt --dist normal --method best)
run(2 "^$" fit ${WORK}/qelcalc_weibull.txt --dist weibull --out x.csv)
# summary: the extended summary of a column (quartiles of type 6 and moments
# as R's quantile(x, type = 6), var and sd give them).
file(WRITE ${WORK}/qelcalc_summary.txt "2\n4\n4\n4\n5\n5\n7\n9\n")
run(0 "^n 8\nmean 5\nstddev 2\\.13808993529939[0-9]*\nvariance 4\\.57142857142857[0-9]*\nsum 40\nminimum 2\nq1 4\nmedian 4\\.5\nq3 6\\.5\nmaximum 9\nmodecount 1\nmodefrequency 3\nmode 4\n$"
    summary ${WORK}/qelcalc_summary.txt)
run(0 "^n 3\nmean 0\\.58333333333333[0-9]*\nstddev 0\\.38188130791298[0-9]*\nvariance 0\\.14583333333333[0-9]*\nsum 1\\.75\nminimum 0\\.25\nq1 0\\.25\nmedian 0\\.5\nq3 1\nmaximum 1\nmodecount 0\nmodefrequency 0\n$"
    summary -)
run(2 "^$" summary)
run(2 "^$" summary ${WORK}/qelcalc_bad.txt)
run(2 "^$" summary ${WORK}/qelcalc_summary.txt --upper 1)
# table: a two-way table of counts, one row a line. The values are R's
# chisq.test(matrix(c(12, 3, 5, 9), 2), correct = FALSE) and fisher.test,
# and gamma = (108 - 15) / (108 + 15) from the pair counts.
file(WRITE ${WORK}/qelcalc_table.txt "12 5\n\n3 9\n")
file(WRITE ${WORK}/qelcalc_table3.txt "20 15 30\n25 10 8\n")
file(WRITE ${WORK}/qelcalc_ragged.txt "1 2 3\n4 5\n")
file(WRITE ${WORK}/qelcalc_negative.txt "1 2\n-4 5\n")
run(0 "^chisq 5\\.854831932773[0-9]*\nchisq_df 1\nchisq_p 0\\.0155343414[0-9]*\n$"
    table ${WORK}/qelcalc_table.txt)
run(0 "^fisher_p 0\\.025327687033[0-9]*\nconcordant 108\ndiscordant 15\ntied 283\npairs 406\nsomers_d_rows 0\\.44285714285714[0-9]*\nsomers_d_columns 0\\.4558823529411[0-9]*\ngamma 0\\.7560975609756[0-9]*\n"
    table ${WORK}/qelcalc_table.txt --want concordance,fisher)
run(0 "^expected 1 8\\.79310344827586[0-9]* 8\\.2068965517241[0-9]*\nexpected 2 6\\.2068965517241[0-9]* 5\\.7931034482758[0-9]*\ntotal 29\n$"
    table ${WORK}/qelcalc_table.txt --want expected,total)
# From standard input (qelcalc_input.txt: a table of one column).
run(0 "^row_totals 0\\.25 0\\.5 1\ntotal 1\\.75\n$" table - --want rowtotals,total)
# A 2 x 3 table: chi-square on 2 degrees of freedom; Fisher's test needs 2 x 2.
run(0 "^chisq 10\\.235646360982[0-9]*\nchisq_df 2\nchisq_p 0\\.0059890457[0-9]*\nfisher_p NaN\n$"
    table ${WORK}/qelcalc_table3.txt --want chisq,fisher)
run(2 "^$" table ${WORK}/qelcalc_ragged.txt)
run(2 "^$" table ${WORK}/qelcalc_negative.txt)
run(2 "^$" table ${WORK}/qelcalc_bad.txt)
run(2 "^$" table ${WORK}/no_such_file.txt)
run(2 "^$" table ${WORK}/qelcalc_table.txt --want chisq,sideways)
run(2 "^$" table ${WORK}/qelcalc_table.txt --upper 1)
run(2 "^$" table)
# test with the distribution-free tests: values from R for the table below
# (tools/reference/gen_qelcalc_rank_tests.R prints them).
file(WRITE ${WORK}/qelcalc_groups.csv "a,b,c\n1.83,0.878,2.1\n0.5,0.647,3.3\n1.62,0.598,2.9\n2.48,2.05,4.0\n1.68,1.06,1.9\n1.88,1.29,3.6\n1.55,1.06,\n3.06,3.14,\n1.3,1.29,\n")
file(WRITE ${WORK}/qelcalc_long.txt "value group\n1.83 a\n0.878 b\n2.1 c\n0.5 a\n0.647 b\n3.3 c\n1.62 a\n0.598 b\n2.9 c\n2.48 a\n2.05 b\n4.0 c\n1.68 a\n1.06 b\n1.9 c\n1.88 a\n1.29 b\n3.6 c\n1.55 a\n1.06 b\n3.06 a\n3.14 b\n1.3 a\n1.29 b\n")
file(WRITE ${WORK}/qelcalc_long2.csv "group,value\nb,0.878\na,1.83\nb,0.647\na,0.5\nb,0.598\na,1.62\nb,2.05\na,2.48\nb,1.06\na,1.68\nb,1.29\na,1.88\nb,1.06\na,1.55\nb,3.14\na,3.06\nb,1.29\na,1.3\n")
file(WRITE ${WORK}/qelcalc_ga.txt "1.83\n0.5\n1.62\n2.48\n1.68\n1.88\n1.55\n3.06\n1.3\n")
file(WRITE ${WORK}/qelcalc_gb.txt "0.878\n0.647\n0.598\n2.05\n1.06\n1.29\n1.06\n3.14\n1.29\n")
file(WRITE ${WORK}/qelcalc_gc.txt "2.1\n3.3\n2.9\n4.0\n1.9\n3.6\n")
set(mw_out "^first a\nsecond b\nfirst_n 9\nsecond_n 9\nfirst_median 1\\.(68|6799999)[0-9]*\nsecond_median 1\\.06[0-9]*\nestimate 0\\.56[0-9]*\nlower -0\\.369999999[0-9]*\nupper 1\\.183[0-9]*\nachieved_confidence 0\\.957739893[0-9]*\nW 103\np 0\\.133320215[0-9]*\nadjusted_p 0\\.132919458[0-9]*\n$")
run(0 "${mw_out}" test mann-whitney ${WORK}/qelcalc_groups.csv)
run(0 "W 103\np 0\\.133320215" test mann-whitney ${WORK}/qelcalc_ga.txt ${WORK}/qelcalc_gb.txt)
# Labels in order of appearance: b first, so W is the rank sum of b.
run(0 "^first b\nsecond a\nfirst_n 9\nsecond_n 9\n.*\nestimate -0\\.56[0-9]*\n.*\nW 68\np 0\\.133320215"
    test mann-whitney ${WORK}/qelcalc_long2.csv --group-column 1 --value-column 2)
run(0 "^first b\nsecond a\n.*W 68\n" test mann-whitney ${WORK}/qelcalc_groups.csv --column 2
    --column2 1)
run(0 "\nlower -Inf\nupper 1\\.0[0-9]*\n" test mann-whitney ${WORK}/qelcalc_groups.csv
    --alternative less)
set(kw_out "^H 10\\.4399999[0-9]*\ndf 2\np 0\\.00540732912[0-9]*\nadjusted_H 10\\.4490861[0-9]*\nadjusted_p 0\\.00538281891[0-9]*\ngroups 3\ngroup1_label a\ngroup1_n 9\ngroup1_median 1\\.(68|6799999)[0-9]*\ngroup1_mean_rank 12\ngroup1_z -0\\.268328157[0-9]*\ngroup2_label b\ngroup2_n 9\ngroup2_median 1\\.06[0-9]*\ngroup2_mean_rank 8\ngroup2_z -2\\.41495341[0-9]*\ngroup3_label c\ngroup3_n 6\ngroup3_median 3\\.09999[0-9]*\ngroup3_mean_rank 20\ngroup3_z 3\n$")
run(0 "${kw_out}" test kruskal-wallis ${WORK}/qelcalc_groups.csv)
run(0 "${kw_out}" test kruskal-wallis ${WORK}/qelcalc_long.txt --value-column 1 --group-column 2)
run(0 "^H 10\\.4399999[0-9]*\n" test kruskal-wallis ${WORK}/qelcalc_ga.txt ${WORK}/qelcalc_gb.txt
    ${WORK}/qelcalc_gc.txt)
run(0 "^overall_median 1\\.(755|75499999[0-9]*)\nchi_square 8\\.88888888[0-9]*\ndf 2\np 0\\.0117436284[0-9]*\n.*\nflags 0\nstatus 0\ngroups 3\ngroup1_label a\ngroup1_n 9\ngroup1_count_at_or_below 5\ngroup1_count_above 4\ngroup1_median 1\\.(68|6799999)[0-9]*\n.*group2_count_at_or_below 7\ngroup2_count_above 2\n.*group3_count_at_or_below 0\ngroup3_count_above 6\n"
    test mood ${WORK}/qelcalc_long.txt --value-column 1 --group-column 2)
run(0 "^overall_median .*\nlower [-0-9.]+\nupper [-0-9.]+\nachieved_confidence 0\\.9[0-9]*\n"
    test mood ${WORK}/qelcalc_groups.csv --columns 1,2)
file(STRINGS ${WORK}/qelcalc_groups.csv friedman_rows LIMIT_COUNT 7)
string(REPLACE ";" "\n" friedman_rows "${friedman_rows}")
file(WRITE ${WORK}/qelcalc_blocks.csv "${friedman_rows}\n")
run(0 "^blocks 6\ntreatments 3\ngrand_median [0-9.]*\nS 10\\.3333333[0-9]*\ndf 2\np 0\\.00570354899[0-9]*\nadjusted_S NaN\nadjusted_p -1\ntreatment1_label a\ntreatment1_median [0-9.]*\ntreatment1_rank_sum 11\ntreatment1_fitted( [0-9.]+)+\ntreatment2_label b\n.*treatment2_rank_sum 7\n.*treatment3_rank_sum 18\ntreatment3_fitted( [0-9.]+)+\n$"
    test friedman ${WORK}/qelcalc_blocks.csv)
run(0 "^n 9\nmedian 1\\.(68|6799999)[0-9]*\nnarrower_confidence 0\\.8203125[0-9]*\nwider_confidence 0\\.9609375[0-9]*\nnarrower_lower 1\\.55[0-9]*\ninterpolated_lower 1\\.35697674[0-9]*\nwider_lower 1\\.3[0-9]*\nnarrower_upper 1\\.(88|87999[0-9]*)\ninterpolated_upper 2\\.34325581[0-9]*\nwider_upper 2\\.48[0-9]*\nnarrower_position 3\nwider_position 2\np 0\\.039062(5|49999)[0-9]*\ncount_below 1\ncount_equal 0\ncount_above 8\nstatus 0\n$"
    test sign ${WORK}/qelcalc_groups.csv --mu 1)
run(0 "^n 9\nestimate 0\\.46[0-9]*\nachieved_confidence 0\\.955989015[0-9]*\nlower 0\\.01[0-9]*\nupper 0\\.786[0-9]*\nW 40\np 0\\.0440109840[0-9]*\n$"
    test wilcoxon ${WORK}/qelcalc_groups.csv --column 1 --column2 2)
run(0 "^k 1\\.7\ncount_below 5\ncount_above 4\nobserved_runs 8\nexpected_runs 5\\.44444444[0-9]*\np 0\\.142857142[0-9]*\n$"
    test runs ${WORK}/qelcalc_ga.txt --k 1.7)
# Bad input: one-line errors, exit status 2.
file(WRITE ${WORK}/qelcalc_constant.csv "x,y\n1,2\n2,2\n3,2\n")
file(WRITE ${WORK}/qelcalc_badcell.csv "x,y\n1,2\n2,two\n3,4\n")
file(WRITE ${WORK}/qelcalc_infinite.txt "1\n2\ninf\n")
run(2 "^$" test mann-whitney ${WORK}/qelcalc_constant.csv)
run(2 "^$" test mann-whitney ${WORK}/qelcalc_groups.csv --columns 1,2,3)
run(2 "^$" test mann-whitney ${WORK}/qelcalc_groups.csv --column2 9)
run(2 "^$" test kruskal-wallis ${WORK}/qelcalc_groups.csv --columns 2)
run(2 "^$" test kruskal-wallis ${WORK}/qelcalc_ga.txt)
run(2 "^$" test kruskal-wallis ${WORK}/qelcalc_badcell.csv)
run(2 "^$" test kruskal-wallis ${WORK}/qelcalc_ga.txt ${WORK}/qelcalc_empty.txt)
run(2 "^$" test kruskal-wallis ${WORK}/qelcalc_ga.txt ${WORK}/qelcalc_infinite.txt)
run(2 "^$" test mood ${WORK}/qelcalc_long.txt --group-column 2 --columns 1,2)
run(2 "^$" test mood ${WORK}/qelcalc_badcell.csv --value-column 2 --group-column 1)
run(2 "^$" test friedman ${WORK}/qelcalc_groups.csv)
run(2 "^$" test friedman ${WORK}/qelcalc_groups.csv --columns 1)
run(2 "^$" test friedman ${WORK}/qelcalc_badcell.csv)
run(2 "^$" test sign ${WORK}/qelcalc_badcell.csv --column 2)
run(2 "^$" test wilcoxon ${WORK}/qelcalc_groups.csv --column 1 --column2 3)
run(2 "^$" test wilcoxon ${WORK}/qelcalc_groups.csv --approximate)
run(2 "^$" test runs ${WORK}/qelcalc_ga.txt --mu 1)
run(2 "^$" test runs)

# matrix: factors and answers of a square matrix read one row a line.
file(WRITE ${WORK}/qelcalc_matrix.txt "4 12 -16\n12, 37, -43\n\n-16 -43 98\n")
file(WRITE ${WORK}/qelcalc_matrix_ragged.txt "1 2\n3\n")
file(WRITE ${WORK}/qelcalc_matrix_singular.txt "1 2\n2 4\n")
run(0 "^2 6 -8\n0 1 5\n0 0 3\n$" matrix chol ${WORK}/qelcalc_matrix.txt)
run(0 "^3[56]\\.99999999999[0-9]*\n$|^36\n$" matrix det ${WORK}/qelcalc_matrix.txt)
run(0 "^values 0\\.0188049804608[0-9]* 15\\.50396322940[0-9]* 123\\.4772317901[0-9]*\n" matrix eigen ${WORK}/qelcalc_matrix.txt)
run(0 "^singular matrix\n$" matrix inv ${WORK}/qelcalc_matrix_singular.txt)
run(0 "^not positive definite at row 1 \\(residual 0\\)\n$" matrix chol ${WORK}/qelcalc_matrix_singular.txt)
run(2 "^$" matrix det ${WORK}/qelcalc_matrix_ragged.txt)
run(2 "^$" matrix lu ${WORK}/qelcalc_describe.txt)
run(2 "^$" matrix solve ${WORK}/qelcalc_matrix.txt)
run(0 "qelcalc matrix lu" matrix --help)
# Proportions and variances (R: 1 - 0.05^(1/10) and fisher.test).
run(0 "events 0\ntrials 10\nproportion 0\nlower 0\nupper 0\\.2588655508930[0-9]*\n"
    test proportion --events 0 --trials 10 --method lyn-exact)
run(0 "exact_p 0\\.09324880049314[0-9]*\n$" test two-proportions --events 15,9 --trials 40,45)
file(WRITE ${WORK}/qelcalc_events.txt "1\n0\n1\n1\n")
run(0 "^events 3\ntrials 4\n" test proportion ${WORK}/qelcalc_events.txt --method wilson)
run(0 "f_df1 8\nf_df2 5\n$" test two-variances ${WORK}/qelcalc_groups.csv --column 1 --column2 3 --levene)
run(2 "^$" test proportion --events 7 --trials 3)
run(2 "^$" test proportion --events 1 --trials 3 --method bogus)
run(2 "^$" test proportion ${WORK}/qelcalc_input.txt)
run(2 "^$" test two-variances --variances 2,3)
run(2 "^$" test variance ${WORK}/qelcalc_events.txt --variance0 0)
# power: a solve per design against R (tools/reference/gen_qelcalc_power.R
# prints the values), and the one-line errors.
set(hdr "^n effect power target\n")
run(0 "${hdr}64 0\\.5 0\\.80[0-9]* 0\\.80*[0-9]*\n$" power t --effect 0.5 --power 0.8 --two-sample)
run(0 "${hdr}10 0\\.5 0\\.3526080824[0-9]* NaN\n20 0\\.5 0\\.6087794846[0-9]* NaN\n$"
    power z --n 10,20 --effect 0.5)
run(0 "${hdr}10 -0\\.85283751[0-9]* 0\\.80*[0-9]* NaN\nextents -[0-9.]+ 0\n$"
    power paired --n 10 --power 0.8 --alternative less --extents)
run(0 "${hdr}50 0\\.6760661477[0-9]* [0-9.]+ NaN\n50 0\\.1524131624[0-9]* [0-9.]+ NaN\n$"
    power prop --null 0.4 --n 50 --power 0.8 --two-sample)
run(0 "${hdr}37 2 0\\.9[0-9]* 0\\.90*[0-9]*\n$"
    power variance --method chisq --effect 2 --power 0.9 --alternative greater)
run(0 "${hdr}76 2\\.5 0\\.9[0-9]* 0\\.90*[0-9]*\n$"
    power poisson --rate 2 --effect 0.5 --power 0.9 --alternative greater)
run(0 "${hdr}[0-9]+ 1 0\\.8[0-9]* 0\\.80*[0-9]*\n$" power welch --sd1 1 --sd2 3 --effect 1 --power 0.8)
run(2 "^$" power t --n 10)
run(2 "^$" power t --n 10 --effect 1 --power 0.9)
run(2 "^$" power t --n 10 --power 0.05)
run(2 "^$" power welch --n 10 --power 0.01 --alpha 0.01)
run(2 "^$" power prop --n 10 --effect 0.7)
run(2 "^$" power variance --n 10 --effect -1)
run(2 "^$" power poisson --n 10 --effect -3 --rate 2)
run(2 "^$" power variance --n 10 --power 0.9 --method anova)
run(2 "^$" power t --n 0 --power 0.9)
run(2 "^$" power anova --n 10 --power 0.9)
run(2 "^$" power t --n 10 --power 0.9 --null 0.5)
# tost: the power of the difference -0.3 at n = 20 (mpmath, tests/data/
# tost_power.csv) gives back -0.3 and its mirror; a target above the peak
# gives one NaN row.
run(0 "${hdr}20 -0\\.(29999999|30000000)[0-9]* 0\\.69[0-9]* NaN\n20 0\\.(29999999|30000000)[0-9]* 0\\.69[0-9]* NaN\n$"
    power tost --lower -1 --upper 1 --n 20 --power 0.69322369510020596)
run(0 "${hdr}10 NaN 0\\.9[0-9]* NaN\n$" power tost --lower -1 --upper 1 --n 10 --power 0.9)
run(2 "^$" power tost --lower 1 --n 10 --power 0.9)
run(2 "^$" power tost --lower -1 --upper 1 --n 10 --power 0.9 --paired --one-sample)

# curvefit: a straight line through five points (R: lm(y ~ x)), a fit with
# no term, and bad input.
file(WRITE ${WORK}/qelcalc_curvefit.txt "x,y\n1,2.1\n2,3.9\n\n3 6.2\n4\t7.8\n5,10.1\n")
run(0 "^n 5\ndegree 1\nintercept 0\\.0(49999999999|500000000000)[0-9]*\nx\\^1 1\\.9(8999999999|9000000000)[0-9]*\nresidual_sd 0\\.188856206322[0-9]*\nr_squared 0\\.99730532890097[0-9]*\ncode 0\n$"
    curvefit ${WORK}/qelcalc_curvefit.txt)
run(0 "^n 5\ndegree 0\nintercept NaN\nresidual_sd NaN\nr_squared NaN\ncode 30019 [^\n]*\n$"
    curvefit ${WORK}/qelcalc_curvefit.txt --degree 0 --no-intercept)
run(0 "^usage:\n  qelcalc curvefit" curvefit --help)
run(2 "^$" curvefit ${WORK}/qelcalc_curvefit.txt --degree 1.5)
run(2 "^$" curvefit ${WORK}/qelcalc_bad.txt)
# gof and ticks: the chi-square test of counts (R: chisq.test(c(30, 70),
# p = c(0.2, 0.8)) gives X-squared 6.25, P 0.01241933065155) and an axis.
file(WRITE ${WORK}/qelcalc_counts.txt "30\n70\n")
run(0 "^category 1 20 5\ncategory 2 80 1\\.25\nstatistic 6\\.25\ndf 1\np 0\\.0124193306515[0-9]*\n$"
    gof ${WORK}/qelcalc_counts.txt --proportions 0.2,0.8)
run(2 "^$" gof ${WORK}/qelcalc_counts.txt --proportions 0.2)
run(2 "^$" gof ${WORK}/qelcalc_bad.txt)
run(0 "^first 0\nlast 10\nscale_min -0\\.188\nscale_max 10\\.18[0-9]*\nincrement 2\ncount 6\nticks 0 2 4 6 8 10\n$"
    ticks 0.3 9.7)
run(0 "^first -100\nlast 0\n.*count 6\nticks -100 -80 -60 -40 -20 0\n$" ticks -100 1)
run(0 "^first 1\nlast 9\n" ticks 0.3 9.7 --limits 0.5,100)
run(2 "^$" ticks 1 2 --limits a,b)
run(2 "^$" ticks 1 2 --ticks 4)
run(2 "^$" ticks 1)

# quad and sint: the 4-point Gauss-Legendre rule (published constants), the
# 3-point Hermite rule (nodes 0 and +-sqrt(3/2)), sign levels for n = 20
# (tools/reference/gen_sint.py: d 6, levels 0.958610534668, 0.884681701660).
run(0 "^0\\.861136311594052[0-9]* 0\\.347854845137453[0-9]*\n0\\.339981043584856[0-9]* 0\\.652145154862546[0-9]*\n$"
    quad legendre 4)
run(0 "^-1\\.22474487139158[0-9]* 0\\.29540897515091[0-9]*\n0 1\\.18163590060367[0-9]*\n1\\.22474487139158[0-9]* 0\\.29540897515091[0-9]*\n$"
    quad hermite 3)
run(0 "^kind 0\nd 6\nlevel_d 0\\.9586105346679[0-9]*\nlevel_d_plus_1 0\\.884681701660[0-9]*\nlambda 0\\.2352342158[0-9]*\n$"
    sint 20 --confidence 0.95)
run(2 "^$" quad laguerre 2 --alpha -1)
run(2 "^$" quad hermite 2 --alpha 1)
run(2 "^$" quad cheb 3)
run(2 "^$" quad legendre 0)
run(2 "^$" sint 20)
run(2 "^$" sint 20 --confidence 1.5)

# range: R's ptukey(3.5, 3, Inf) = 0.964442958136556, qtukey(0.95, 3, Inf) =
# 3.31449316; for k = 2, P(R > 20) = erfc(10) = 2.088487583762545e-45.
run(0 "^cdf 0\\.9644429581[0-9]*\n$" range cdf 3.5 --k 3)
run(0 "^cdf 2\\.08848758376254[0-9]*e-45\n$" range cdf 20 --k 2 --upper)
run(0 "^inv 3\\.314493[0-9]*\n$" range inv 0.95 --k 3)
run(2 "^$" range cdf 1 --k 1)
run(2 "^$" range inv 0.95 --k 3 --upper)
# tost: the power of the difference -0.3 at n = 20 (mpmath, tests/data/
# tost_power.csv) gives back -0.3 and its mirror; a target above the peak
# gives one NaN row.
run(0 "${hdr}20 -0\\.(29999999|30000000)[0-9]* 0\\.69[0-9]* NaN\n20 0\\.(29999999|30000000)[0-9]* 0\\.69[0-9]* NaN\n$"
    power tost --lower -1 --upper 1 --n 20 --power 0.69322369510020596)
run(0 "${hdr}10 NaN 0\\.9[0-9]* NaN\n$" power tost --lower -1 --upper 1 --n 10 --power 0.9)
run(2 "^$" power tost --lower 1 --n 10 --power 0.9)
# factorial: a 2^3 with the six one- and two-way terms keeps 1 error df; its
# power is R's 1 - pf(qf(0.95, 1, 1), 1, 1, ncp = 32) (tools/reference/
# gen_factorial_power_r.R). gff: a one-way of 3 levels, n 5, maximum
# difference 1, is power.anova.test's 0.2211398.
set(fhdr "^reps centerpoints effect power target runs\n")
run(0 "${fhdr}1 0 4 0\\.3428357[0-9]* NaN 8\n$"
    power factorial --factors 3 --runs 8 --reps 1 --center-points 0 --effect 4 --terms 6)
run(0 "^reps effect power target runs\n5 1 0\\.2211398[0-9]* NaN 15\n$"
    power gff --levels 3 --reps 5 --effect 1)
run(2 "^$" power factorial --factors 4 --runs 16 --blocks 16 --reps 1 --center-points 0 --effect 1)
run(2 "^$" power factorial --factors 3 --runs 8 --reps 1 --effect 1)
run(2 "^$" power gff --levels 3,1 --reps 5 --effect 1)
run(2 "^$" power tost --lower -1 --upper 1 --n 10 --power 0.9 --paired --one-sample)

# sort: stable multi-key order (first key most significant, minus descending);
# ties on every key keep their input order; a header stays on top.
file(WRITE ${WORK}/qelcalc_sort.csv "a,b,c\n1,2,3\n2,1,9\n1,1,5\n2,1,7\n1,2,3.0\n")
run(0 "^a,b,c\n1,1,5\n1,2,3\n1,2,3\\.0\n2,1,9\n2,1,7\n$" sort ${WORK}/qelcalc_sort.csv --by 1,-3)
run(0 "^a,b,c\n2,1,9\n1,1,5\n2,1,7\n1,2,3\n1,2,3\\.0\n$" sort ${WORK}/qelcalc_sort.csv --by 2)
run(2 "^$" sort ${WORK}/qelcalc_sort.csv --by 5)
run(2 "^$" sort ${WORK}/qelcalc_sort.csv --by 0)

# test variances: the groups of the other group tests; --normal gives
# Bartlett's test (F for two groups) without Levene's fields.
run(0 "^method multiple-comparisons\nlevene_statistic [0-9.]+\nlevene_p 0\\.[0-9]+\nstatistic NaN\np [0-9.e-]+\nindividual_confidence 0\\.98333[0-9]*\ngroups 3\n"
    test variances ${WORK}/qelcalc_groups.csv)
run(0 "^method Bartlett\nlevene_statistic NaN\nlevene_p NaN\nstatistic [0-9.]+\np 0\\.[0-9]+\n"
    test variances ${WORK}/qelcalc_groups.csv --normal)
run(0 "^method F\nlevene_statistic NaN\nlevene_p NaN\nstatistic [0-9.]+\np [0-9.e-]+\nindividual_confidence 0\\.9[45][0-9]*\n" test variances ${WORK}/qelcalc_groups.csv
    --columns 1,2 --normal --confidence 0.9)
run(2 "^$" test variances ${WORK}/qelcalc_groups.csv --confidence 1)
run(2 "^$" test variances ${WORK}/qelcalc_groups.csv --columns 2)
run(2 "^$" test variances ${WORK}/qelcalc_groups.csv --upper)

# group: a missing cell is a group of its own, last; frequencies and a
# weighted mean; defined order; all combinations with an empty group.
file(WRITE ${WORK}/qelcalc_group.csv "g,h,v,f\n2,8,1.5,1\n1,7,2,2\n2,7,3.5,1\n*,7,4,1\n,8,5,3\n1,8,*,1\n")
run(0 "^1 2 2\n2 2 2\\.5\n\\* 2 4\\.5\n$" group ${WORK}/qelcalc_group.csv --by 1 --value-column 3)
run(0 "^1 7 2 2\n1 8 1 NaN\n2 7 1 3\\.5\n2 8 1 1\\.5\n\\* 7 1 4\n\\* 8 3 5\n$"
    group ${WORK}/qelcalc_group.csv --by 1,2 --all-combinations --value-column 3 --freq 4)
run(0 "^2 2\n1 2\n\\* 2\n$" group ${WORK}/qelcalc_group.csv --by 1 --order defined --levels 2)
run(0 "^1 0\n2 1\n3 0\n4 2\n5 2\n6 1\n$" group ${WORK}/qelcalc_group.csv --by 1 --order defined --levels 2 --indicators)
run(2 "^$" group ${WORK}/qelcalc_group.csv --by 9)
run(2 "^$" group ${WORK}/qelcalc_group.csv --by 1 --order sideways)
run(2 "^$" group ${WORK}/qelcalc_group.csv)

# ranks: R's rank(c(3, NA, 1, 3, 2), na.last = "keep") is 3.5 NA 1 3.5 2;
# rank(-x, ties.method = "last", na.last = "keep") is 2 NA 4 1 3.
file(WRITE ${WORK}/qelcalc_ranks.txt "3\n*\n1\n3\n2\n")
run(0 "^3\\.5\n\\*\n1\n3\\.5\n2\n$" ranks ${WORK}/qelcalc_ranks.txt)
run(0 "^2\n\\*\n4\n1\n3\n$" ranks ${WORK}/qelcalc_ranks.txt --descending --ties first)
run(2 "^$" ranks ${WORK}/qelcalc_ranks.txt --ties x)
run(2 "^$" ranks ${WORK}/qelcalc_bad.txt)
# Hostile input: CR-only line ends, empty input, a number beyond the range.
file(WRITE ${WORK}/qelcalc_cr.txt "1\r2\r3\r")
run(0 "^n 3\n" describe --file ${WORK}/qelcalc_cr.txt)
file(WRITE ${WORK}/qelcalc_empty.txt "")
run(2 "^$" describe --file ${WORK}/qelcalc_empty.txt)
run(2 "^$" normal cdf --file ${WORK}/qelcalc_empty.txt)
file(WRITE ${WORK}/qelcalc_huge.txt "1e999\n")
run(2 "^$" describe --file ${WORK}/qelcalc_huge.txt)

# tukey: the published 5 percent point 3.88 (k = 3, df = 10); R's
# ptukey(3.5, 4, 20, lower.tail = FALSE) = 0.0949584505485567.
run(0 "^crit 3\\.8(8|79999)[0-9]*\npossible true\n$" tukey crit 0.05 --k 3 --df 10)
run(0 "^pvalue 0\\.09495845054[0-9]*\npossible true\n$" tukey pvalue 3.5 --k 4 --df 20)
run(2 "^$" tukey crit 0.05 --k 3)
run(2 "^$" tukey crit 1.5 --k 3 --df 10)

# maxmod: mpmath double integrals (tests/data/studentized_maximum_mp.csv):
# P(max T_i > 2.13) = 0.0517073048759430 (checked to 2e-12 relative), two variables with lambda
# 1/sqrt(2), df = 10, so the 2.13 is also the critical value at that level;
# one normal variable, sigma known: the two-sided 5 percent point 1.959964.
set(dunnett --df 10 --lambdas 0.7071067811865475,0.7071067811865475 --one-sided)
run(0 "^pvalue 0\\.05170730487(59[0-9]|60[0-9])[0-9]*\npossible true\n$" maxmod pvalue 2.13 ${dunnett})
run(0 "^crit 2\\.1(3|29999)[0-9]*\npossible true\n$" maxmod crit 0.051707304875943 ${dunnett})
run(0 "^crit 1\\.95996398454005[0-9]*\npossible true\n$" maxmod crit 0.05 --df inf --lambdas 0)
run(0 "^pvalue 1\npossible false\n$" maxmod pvalue -1 --df 2 --lambdas 0.5,0.5)
run(2 "^$" maxmod pvalue 2 --df 10 --lambdas 0.5,1)
run(2 "^$" maxmod pvalue 2 --df 10)
run(2 "^$" maxmod crit 0 --df 10 --lambdas 0.5)
run(2 "^$" maxmod pvalue 2 --df 10 --lambdas 0.5,abc)
